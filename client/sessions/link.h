// A link: one user session's connection to its engine, and the wish to stop what runs on it. Service contexts and
// statements share it; when the session ends the link closes, everything made from the connection is dropped first, and
// who still holds the link finds it closed. A connection out of a pool goes back there and serves later sessions, each
// through a link of its own: what still knows a former link does nothing to a later session.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "engine/engine.h"
#include "values/lob_descriptor.h"

class Link;

// A share of a link. It changes under the link's serial lock, whose holder reads it freely; who does not hold that lock
// takes a share of his own.
class LinkShare {
public:
    [[nodiscard]] const std::shared_ptr<Link>& Get() const { return link_; }
    [[nodiscard]] std::shared_ptr<Link> Share() const;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() const;
    std::shared_ptr<Link> Set(std::shared_ptr<Link> link) noexcept;    // answers the one before

private:
    mutable std::mutex mutex_;    // between Share and Set
    std::shared_ptr<Link> link_;
};

// Somebody who holds queries or other things of the connection: told before it goes.
class LinkUser {
public:
    // Drop what was made from the connection, but for what rests in the statement cache; the link is left afterwards.
    // May not throw.
    virtual void LinkClosed() noexcept = 0;
    // The same when the session goes on with another connection.
    virtual void ConnectionChanged() noexcept { LinkClosed(); }

protected:
    LinkUser() = default;
    virtual ~LinkUser();
    LinkUser(const LinkUser&) = delete;
    LinkUser& operator=(const LinkUser&) = delete;

    // Joins a link, leaving the one before; null only leaves.
    void Use(std::shared_ptr<Link> link) noexcept;
    [[nodiscard]] const std::shared_ptr<Link>& UsedLink() const { return link_.Get(); }
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> LinkSerial() const { return link_.Serial(); }

private:
    friend class Link;
    LinkShare link_;
    LinkUser* previous_ = nullptr;
    LinkUser* next_ = nullptr;
};

// Something a room above keeps with a session, such as the statement cache.
struct LinkData {
    virtual ~LinkData() = default;
};

// The branch of a global transaction that a session works in. While it is there, only calls on the branch end the
// transaction: whatever else would is refused (2089). When the session goes, so does the branch.
struct LinkBranch : LinkData {
    // Before a statement runs: 24761 when the branch's work is lost.
    virtual Status Check(bool in_transaction) = 0;
};

class Session;
struct Connected;

// How a session is given back to its pool.
struct GivingBack {
    bool drop = false;                 // the connection is to be closed
    std::optional<std::string> tag;    // what it is to be known by from now on
};

// A connection's place in a pool, which goes with it: when it goes, the pool has one connection less.
class LinkPlace {
public:
    virtual ~LinkPlace() = default;
    // A session has begun; under the serial lock of its link. False when the pool has gone meanwhile.
    [[nodiscard]] virtual bool Serve(Session& session, const std::shared_ptr<Link>& link) noexcept = 0;
    // The connection, with its place in it.
    virtual void TakeBack(Connected connected, GivingBack how) noexcept = 0;
};

// A connection and what lasts as long. They go in the opposite order: the cached statements first.
struct Connected {
    std::shared_ptr<engine::Database> database;
    std::string user;    // who is logged on; empty: the operating-system user
    std::unique_ptr<LinkPlace> place;    // null: it is nobody else's
    std::unique_ptr<engine::Connection> connection;
    std::unique_ptr<LinkData> statement_cache;
};

class Link {
public:
    // Closed as yet. `threaded`: calls on the link are serialised.
    explicit Link(bool threaded);
    ~Link();
    Link(const Link&) = delete;
    Link& operator=(const Link&) = delete;

    [[nodiscard]] bool Closed() const { return !connection_; }
    [[nodiscard]] engine::Connection& Engine() { return *connection_; }    // not when closed
    [[nodiscard]] engine::Database& Database() { return *database_; }
    [[nodiscard]] LinkPlace* Place() { return place_.get(); }    // null when the connection is out of no pool
    [[nodiscard]] const std::shared_ptr<std::recursive_mutex>& Serial() const { return serial_; }

    // For the first time; the connection heeds the link's wish to stop.
    void Open(Connected connected) noexcept;
    [[nodiscard]] const std::shared_ptr<engine::StopRequest>& Stop() const { return stop_; }

    // Stops the call that runs on the connection, or the next one that executes or fetches; forgets a stop that met
    // none. From any thread.
    void Cancel() noexcept;
    void ForgetCancel() noexcept { (void)stop_->Take(); }
    // To be told what an execute or a fetch answered: one that was stopped (1013) has met the wish, which is forgotten.
    void Answered(const Status& status) noexcept;

    // Whether a stop was asked for, which is forgotten.
    [[nodiscard]] bool TakeCancel() noexcept { return stop_->Take(); }

    // Ends the session's own transaction: 2089 within a branch. What calls opened in it (OCILobOpen) is closed: a commit
    // that finds something open is a success with information (22297).
    Status Commit();
    Status Rollback();
    // Whether a statement may run that ends transactions, or one that does not.
    Status CheckBranch(bool ends_transaction);
    // Of a session that works in no branch.
    [[nodiscard]] bool InLocalTransaction() const { return local_started || (connection_ && connection_->InTransaction()); }

    // Goes on with another connection of the same user; what was made from the one before is dropped, and it is
    // answered as it is, perhaps in a transaction.
    std::unique_ptr<engine::Connection> Exchange(std::unique_ptr<engine::Connection> next) noexcept;

    // Drops what depends on the connection, and the connection: what is open is rolled back.
    void Close() noexcept;
    // The same, but a connection out of a pool goes back there. Nothing may be open on it.
    void GiveBack(GivingBack how) noexcept;

    std::unique_ptr<LinkData> statement_cache;
    std::unique_ptr<LinkBranch> branch;                  // null: the session's work is its own
    std::unique_ptr<engine::Connection> spare;           // for the next branch that is set aside; in no transaction
    bool local_started = false;                          // an application has begun a transaction of its own
    const std::shared_ptr<values::LobSession> lobs;    // what the session's locators share
    std::string user;                    // who is logged on; empty: the operating-system user
    std::uint32_t open_statements = 0;    // OCI_ATTR_NUM_OPEN_STMTS

private:
    friend class LinkUser;
    void Add(LinkUser& user) noexcept;
    void Remove(LinkUser& user) noexcept;
    LinkUser* AnyUser() noexcept;
    void DropUsers(void (LinkUser::*told)() noexcept) noexcept;
    Connected TakeApart() noexcept;    // under the serial lock

    std::shared_ptr<engine::Database> database_;
    const std::shared_ptr<engine::StopRequest> stop_;
    std::unique_ptr<LinkPlace> place_;
    std::unique_ptr<engine::Connection> connection_;
    std::shared_ptr<std::recursive_mutex> serial_;
    std::mutex cancel_mutex_;    // between Cancel and the end of the connection
    std::mutex users_mutex_;
    LinkUser* first_user_ = nullptr;
};
