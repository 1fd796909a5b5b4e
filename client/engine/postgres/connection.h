// One user's session on a PostgreSQL server: transactions, marks and savepoints, the rows that still come, stopping.
//
// A statement that runs in a transaction with work in it has a savepoint under it, since the server gives a transaction
// up with any error: what fails goes back to that one. Savepoints of applications are known here by name, so that going
// back to one that is not there asks nobody.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "engine/postgres/home.h"
#include "engine/postgres/wire.h"

namespace engine::postgres {

class PgLobStore;
class PgQuery;

// A table or view as it was when it was first asked for.
struct TableColumn {
    std::string name;       // as it stands in SQL; empty: there is none of that number
    std::string domain;     // of its type, where that is one of the schema kelp, or of large objects
    Column described;
};
struct Table {
    std::string name;       // as it stands in SQL
    bool has_rows = false;  // with places of their own
    std::vector<TableColumn> columns;    // by number, from 1
};

class PgConnection final : public Connection {
public:
    PgConnection(std::shared_ptr<Home> home, Credentials credentials, std::unique_ptr<Wire> wire);
    ~PgConnection() override;
    PgConnection(const PgConnection&) = delete;
    PgConnection& operator=(const PgConnection&) = delete;

    Status ChangePassword(const std::string& user, const std::string& old_password,
                          const std::string& new_password) override;
    Status Compile(const StatementSource& source, std::unique_ptr<Query>& query, std::uint32_t& error_offset) override;
    Status Begin(TransactionMode mode) override;
    Status Commit() override;
    Status Rollback() override;
    [[nodiscard]] bool InTransaction() const override { return in_transaction_ && !wire_->Broken(); }
    Status SetMark() override;
    Status UndoToMark() override;
    Status DropMark() override;
    Status Prepare(const Xid& xid, bool& read_only) override;
    Status CommitPrepared(const Xid& xid) override;
    Status RollbackPrepared(const Xid& xid) override;
    Status Recover(std::vector<Xid>& prepared) override;
    Status KeepsPrepared(const Xid& xid, bool& kept) override;
    Status Another(std::shared_ptr<const StopRequest> stop, std::unique_ptr<Connection>& connection) override;
    void Obey(std::shared_ptr<const StopRequest> stop) noexcept override { wire_->Obey(std::move(stop)); }
    Status Describe(std::string_view name, ObjectKind kind, ObjectDescription& object) override;
    Status UseSchema(std::string& schema) override;
    void PreferSchemaOf(const Connection* other) noexcept override;
    LobStore* Lobs() override;
    void WaitForLocks(bool waits) noexcept override { waits_ = waits; }
    Status Ping() override;
    [[nodiscard]] bool Broken() const override { return wire_->Broken() || wire_->Closed(); }
    void Interrupt() noexcept override { wire_->Wake(); }

    // ---- For queries and descriptions

    [[nodiscard]] Wire& Server() { return *wire_; }
    [[nodiscard]] static Status Stopped();
    Status ReadTable(Oid table, Table& read);
    // The same, remembered until this session defines something.
    Status TableOf(Oid table, std::shared_ptr<const Table>& known);
    // The type that a domain is of; any other type as it is.
    Status BaseType(Oid& type);
    // Whether one that was asked about so is of the server's large objects.
    [[nodiscard]] bool IsObjectType(Oid type) const;
    [[nodiscard]] PgLobStore& Large() { return *lobs_; }
    // Makes way for something else: has the query whose rows still come read them ahead, and forgets what closed queries
    // have left with the server. 3114 on a broken connection. Refused while a batch is under way, whose answers come first.
    Status Enter();
    // The same, and ends a transaction before a definition.
    Status Enter(Effect effect);

    // A statement of the application's, from its first command to the end of its batch. Guarded ones have a savepoint.
    enum class Guard : std::uint8_t { none, began, savepoint };
    // Sends what stands before the statement: the beginning of a transaction that it needs (`needs`), or a savepoint.
    Guard SendGuard(bool needs) noexcept;
    // Reads the answers to that. What follows may be stopped.
    Status PassGuard(Guard guard) noexcept;
    // Sends what stands behind it and closes the batch.
    void SendRelease(Guard guard) noexcept;
    // Once the batch is read: goes back to where the guard stood if it has failed, and tells whether the transaction was
    // lost with it. What the transaction did behind the moment `since` of the large objects is undone then.
    static constexpr std::uint64_t kNothing = ~std::uint64_t{0};
    Status Settle(Guard guard, Status status, std::uint64_t since = kNothing) noexcept;
    [[nodiscard]] const Status& Loss() const { return loss_; }    // what took the last transaction with it
    // Ends the savepoint of a statement whose batch ended before it.
    Status DropGuard() noexcept;

    // A savepoint statement of the application's: 1086 where it names none.
    struct SavepointCommand {
        enum class Verb : std::uint8_t { none, set, undo, drop } verb = Verb::none;
        std::string name;    // as the server has it
    };
    static SavepointCommand ReadSavepoint(std::string_view sql);
    Status CheckSavepoint(const SavepointCommand& command);
    void NoteSavepoint(const SavepointCommand& command);

    void Note() noexcept;    // what the server says of the transaction
    void SomethingUndone(std::uint64_t since) noexcept;    // behind that moment; 0: all of it
    void NoteChange() noexcept { changed_ = in_transaction_; }    // rows were changed in it

    // Names that prepared statements have on this connection, and the end of one.
    std::string NewName();
    void Forget(const std::string& name) noexcept;

    // The query whose rows still come; one at most.
    void Stream(PgQuery* query) noexcept { streaming_ = query; }
    [[nodiscard]] bool Streams(const PgQuery* query) const { return streaming_ == query; }

    // Rows of a question of the engine's own, which undoes itself when it fails, as a statement of the application's does.
    Status AskGuarded(const std::string& sql, const Wire::Values& values, Result& result, bool binary_results = true);
    Status Ask(const char* sql, const std::vector<std::string>& values, Result& result);    // texts for texts

private:
    Status SetPath();
    [[nodiscard]] std::size_t LastMark() const noexcept;    // its place; the count of savepoints: there is none
    Status Lose(const Status& failure) noexcept;
    Status Undone(const Status& failure) noexcept;
    Status TellLockWait();
    void ForgetLockWait() noexcept;
    Status FinishPrepared(const char* verb, const Xid& xid);

    std::shared_ptr<Home> home_;
    Credentials credentials_;
    std::unique_ptr<Wire> wire_;
    bool in_transaction_ = false;
    Status loss_;
    bool changed_ = false;              // by what is known of; functions of queries may have done so, too
    std::string branch_question_;       // the statement on the server that tells of a branch; empty: there is none yet
    struct Savepoint {
        std::string name;         // empty: a mark
        unsigned mark = 0;        // its number, which stands in the server's name for it
        std::uint64_t at = 0;     // its moment
    };
    std::vector<Savepoint> savepoints_;    // from the outermost
    unsigned marks_ = 0;
    std::vector<std::string> forgotten_;     // commands that end prepared statements which nobody has any more
    std::uint64_t names_ = 0;
    std::map<Oid, std::shared_ptr<const Table>> tables_;
    struct BaseOfType {
        Oid type;
        bool is_object;
    };
    std::map<Oid, BaseOfType> base_types_;
    std::unique_ptr<PgLobStore> lobs_;
    // The schema that is looked in first, in double quotes where it needs them; null: none but the user's own path.
    std::shared_ptr<const std::string> schema_;
    std::string own_path_;              // empty: not asked for yet
    bool path_stands_ = true;           // the server has what is wanted
    bool path_may_go_ = false;          // with the transaction, or a part of it
    PgQuery* streaming_ = nullptr;
    // Whether statements wait for locks: as it is wished, as the session has it, and as the transaction has it, where
    // that is known. The session's cannot be changed within a transaction, which takes it back when it is rolled back.
    bool waits_ = true;
    bool session_waits_ = true;
    std::optional<bool> local_waits_ = true;
    std::string lock_timeout_;    // of one that waits; asked for once
};

}  // namespace engine::postgres
