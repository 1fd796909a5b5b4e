// One libpq connection, in pipeline mode between its calls: commands are sent one behind the other, closed with Sync, and
// their results read in the same order. It waits for the server, and has it cancel what runs when that is wished for.
//
// What was sent must be read to its end before the connection is used for something else: Drain does so, whatever is
// left. One thread at a time, Wake aside.
#pragma once

#include <chrono>
#include <cstdint>
#include <cstdlib>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include "engine/engine.h"
#include "engine/postgres/errors.h"
#include "engine/postgres/libpq.h"

namespace engine::postgres {

struct ResultDelete {
    void operator()(PGresult* result) const noexcept { PQclear(result); }
};
using Result = std::unique_ptr<PGresult, ResultDelete>;

inline bool IsFailure(const PGresult* result) { return PQresultStatus(result) == PGRES_FATAL_ERROR; }
inline std::uint64_t AffectedBy(const PGresult* result) {
    return std::strtoull(PQcmdTuples(const_cast<PGresult*>(result)), nullptr, 10);
}

// libpq's names of connection parameters and their values; "dbname" may be a URL, which later ones override.
struct Parameters {
    std::vector<std::pair<std::string, std::string>> values;
};

class Wire {
public:
    static Status Connect(const Parameters& parameters, std::shared_ptr<const StopRequest> stop,
                          std::unique_ptr<Wire>& wire);
    ~Wire();
    Wire(const Wire&) = delete;
    Wire& operator=(const Wire&) = delete;

    [[nodiscard]] PGconn* Libpq() const { return connection_; }
    [[nodiscard]] bool Broken() const { return broken_; }
    [[nodiscard]] bool Closed() noexcept;    // looks whether the server has, when nothing is awaited from it
    [[nodiscard]] std::string Where() const {    // host, port and database
        return std::string(PQhost(connection_)) + ':' + PQport(connection_) + '/' + PQdb(connection_);
    }
    [[nodiscard]] bool ServerHasUtf8() const {
        const char* const set = PQparameterStatus(connection_, "server_encoding");
        return set && std::string_view(set) == "UTF8";
    }
    // What the server said last: whether a transaction is open, or has failed.
    [[nodiscard]] PGTransactionStatusType Transaction() const { return PQtransactionStatus(connection_); }

    // ---- Sending. A failure breaks off; what was sent before is read by Drain.
    void Send(const char* sql) noexcept;
    struct Values {
        std::vector<const char*> data;    // null: null
        std::vector<int> lengths, formats;
    };
    void SendQuery(const char* sql, const Values& values, bool binary_results) noexcept;
    void SendPrepare(const char* name, const char* sql, std::span<const Oid> types) noexcept;
    void SendDescribe(const char* name) noexcept;
    void SendExecute(const char* name, const Values& values, bool binary_results) noexcept;
    void Sync() noexcept;
    void OneByOne() noexcept { PQsetSingleRowMode(connection_); }    // the rows of the command that is read next
    void Flush() noexcept { if (!broken_) PQsendFlushRequest(connection_); }    // so that results so far come at once
    // Waits for nothing: gives the server what it can take, and takes what has come.
    void Push() noexcept;

    // ---- Receiving
    // The next result; null behind each command's last one. A broken connection answers null.
    Result Next() noexcept;
    // Results of so many commands are passed over; the first error of them.
    Status Pass(int commands) noexcept;
    // All that is left of what was sent; the first error of it. With `last`, the last result that is none.
    Status Drain(Result* last = nullptr) noexcept;
    [[nodiscard]] bool Idle() const { return syncs_ == 0 && !open_; }    // all that was sent is read
    // Sent, closed and read: a command without values.
    Status Run(const char* sql, Result* last = nullptr) noexcept;

    // Several commands in one text, and no row of theirs.
    void RunScript(const char* commands) noexcept;

    // The status of an error's result, or of the connection that was lost with it.
    Status Answer(const PGresult* result, Verb verb = Verb::other) noexcept;
    Status Lost() noexcept;    // 3113 the first time, 3114 then
    // Of a call that began with a connection: that 3113, once it is lost.
    const Status& Loss() noexcept;
    // The same where it was told to somebody; the status where it was not.
    [[nodiscard]] Status OrLoss(Status status) const noexcept { return loss_.Ok() ? std::move(status) : loss_; }

    // ---- Stopping
    void Obey(std::shared_ptr<const StopRequest> stop) noexcept { stop_ = std::move(stop); }
    [[nodiscard]] bool Asked() const { return stop_ && stop_->Asked(); }
    void Wake() noexcept;    // from any thread: look at the wish
    // Has the server stop what runs; the error comes as its result.
    void Cancel() noexcept;
    // While one lives, waiting looks at the wish to stop.
    class Heeding {
    public:
        explicit Heeding(Wire& wire, bool heeds = true) : wire_(wire), before_(wire.heeds_) { wire.heeds_ = heeds; }
        ~Heeding() { wire_.heeds_ = before_; }
        Heeding(const Heeding&) = delete;
        Heeding& operator=(const Heeding&) = delete;

    private:
        Wire& wire_;
        const bool before_;
    };

    std::vector<Status>* notices = nullptr;    // takes what the server says besides
    [[nodiscard]] std::size_t Told() const noexcept { return notices ? notices->size() : 0; }
    // Those from `first` to before `last` are of what was undone: it is done again, and tells them again.
    void Untell(std::size_t first, std::size_t last) noexcept;
    void TellLast(std::size_t first, std::size_t last) noexcept;    // these go behind the others

private:
    Wire() = default;
    Status Begin(const Parameters& parameters) noexcept;
    Status Poll(std::chrono::steady_clock::time_point end) noexcept;
    Status Settle() noexcept;
    bool Wait() noexcept;
    void Sent(int answer) noexcept;
    Status AfterAll(Status first) noexcept;
    // While one lives, libpq sends what it is given before it goes on, if those are long values.
    class AtOnce {
    public:
        AtOnce(Wire& wire, const Values& values) noexcept;
        ~AtOnce();
        AtOnce(const AtOnce&) = delete;
        AtOnce& operator=(const AtOnce&) = delete;

    private:
        Wire& wire_;
        bool waits_ = false;
    };
    static void OnNotice(void* self, const PGresult* result) noexcept;

    PGconn* connection_ = nullptr;
    int wake_ = -1;
    std::shared_ptr<const StopRequest> stop_;
    std::chrono::steady_clock::time_point cancelled_;
    int syncs_ = 0;             // sent and not read yet
    bool open_ = false;         // something was sent behind the last Sync
    bool heeds_ = false;
    bool broken_ = false;
    Status loss_;               // the 3113, once it was told
    bool short_of_memory_ = false;    // something could not be sent
};

}  // namespace engine::postgres
