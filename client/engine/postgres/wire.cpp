// Connecting, sending, waiting and reading.
#include "engine/postgres/wire.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <new>

#include "handles/errors.h"

namespace engine::postgres {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

constexpr auto kBetweenCancels = 200ms;
constexpr auto kStarving = 2s;
constexpr std::int64_t kLong = std::int64_t{16} << 20;    // bytes
constexpr int kNoticeNumber = 20000;    // what the server, or code in it, tells in its own words
constexpr auto kForever = Clock::time_point::max();

// When a connect that begins now is given up, by the parameter of that name.
Clock::time_point ConnectEnd(PGconn* connection) {
    PQconninfoOption* const options = PQconninfo(connection);
    int seconds = 0;
    for (const PQconninfoOption* option = options; option && option->keyword; ++option) {
        if (std::strcmp(option->keyword, "connect_timeout") == 0 && option->val) seconds = std::atoi(option->val);
    }
    PQconninfoFree(options);
    return seconds > 0 ? Clock::now() + std::chrono::seconds(seconds) : kForever;
}

int Milliseconds(Clock::time_point end) {
    if (end == kForever) return -1;
    const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now()).count();
    return static_cast<int>(std::clamp<std::int64_t>(left + 1, 0, 1'000'000'000));
}

struct CancelDelete {
    void operator()(PGcancel* cancel) const noexcept { PQfreeCancel(cancel); }
};

}  // namespace

// ---- Connecting

Status Wire::Connect(const Parameters& parameters, std::shared_ptr<const StopRequest> stop,
                     std::unique_ptr<Wire>& wire) {
    std::unique_ptr<Wire> made(new Wire);
    made->stop_ = std::move(stop);
    made->wake_ = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (made->wake_ < 0) return Refused(errors::kInputOutputError, "no event to wait for");
    Status status = made->Begin(parameters);
    if (status.Ok()) wire = std::move(made);
    return status;
}

Wire::~Wire() {
    if (connection_) PQfinish(connection_);
    if (wake_ >= 0) close(wake_);
}

Status Wire::Begin(const Parameters& parameters) noexcept try {
    std::vector<const char*> names, values;
    for (const auto& [name, value] : parameters.values) {
        names.push_back(name.c_str());
        values.push_back(value.c_str());
    }
    names.push_back(nullptr);
    values.push_back(nullptr);
    connection_ = PQconnectStartParams(names.data(), values.data(), 1);
    if (!connection_) return Refused(errors::kOutOfMemory);
    PQsetErrorVerbosity(connection_, PQERRORS_VERBOSE);    // the SQLSTATE stands in the message then
    PQsetNoticeReceiver(connection_, OnNotice, this);
    if (Status status = Poll(ConnectEnd(connection_)); !status.Ok()) return status;
    return Settle();
} catch (const std::bad_alloc&) {
    return Refused(errors::kOutOfMemory);
}

Status Wire::Poll(Clock::time_point end) noexcept {
    PostgresPollingStatusType wants = PGRES_POLLING_WRITING;
    if (PQstatus(connection_) == CONNECTION_BAD) return ConnectFailure(PQerrorMessage(connection_));
    while (wants != PGRES_POLLING_OK) {
        const short events = wants == PGRES_POLLING_READING ? POLLIN : POLLOUT;
        pollfd socket{PQsocket(connection_), events, 0};
        const int ready = poll(&socket, 1, Milliseconds(end));
        if (ready < 0 && errno == EINTR) continue;
        if (ready == 0) return Refused(12170, "the server does not answer within connect_timeout");
        wants = PQconnectPoll(connection_);
        if (wants == PGRES_POLLING_FAILED) return ConnectFailure(PQerrorMessage(connection_));
    }
    return {};
}

Status Wire::Settle() noexcept {
    if (PQsetnonblocking(connection_, 1) != 0 || !PQenterPipelineMode(connection_)) {
        return Refused(errors::kOutOfMemory, PQerrorMessage(connection_));
    }
    return {};
}

void Wire::OnNotice(void* self, const PGresult* result) noexcept {
    auto& wire = *static_cast<Wire*>(self);
    const char* severity = PQresultErrorField(result, PG_DIAG_SEVERITY_NONLOCALIZED);
    const bool is_last = severity && (std::strcmp(severity, "FATAL") == 0 || std::strcmp(severity, "PANIC") == 0);
    if (!wire.notices || is_last) return;    // the call that finds the connection lost tells why
    const char* words = PQresultErrorField(result, PG_DIAG_MESSAGE_PRIMARY);
    try {
        wire.notices->push_back(Warning(kNoticeNumber, words ? words : "").From("POSTGRESQL"));
    } catch (const std::bad_alloc&) {    // a notice changes nothing
    }
}

// Notices may have been taken meanwhile.
void Wire::TellLast(std::size_t first, std::size_t last) noexcept {
    last = std::min(last, Told());
    if (first >= last) return;
    const auto begin = notices->begin();
    std::rotate(begin + static_cast<std::ptrdiff_t>(first), begin + static_cast<std::ptrdiff_t>(last), notices->end());
}

void Wire::Untell(std::size_t first, std::size_t last) noexcept {
    last = std::min(last, Told());
    if (first >= last) return;
    TellLast(first, last);
    notices->erase(notices->end() - static_cast<std::ptrdiff_t>(last - first), notices->end());
}

// ---- Sending

// A command that cannot be sent ends the batch: what would come behind it is left out.
void Wire::Sent(int answer) noexcept {
    if (answer == 1) open_ = true;
    else if (PQstatus(connection_) == CONNECTION_BAD) broken_ = true;
    else short_of_memory_ = true;
}

void Wire::Send(const char* sql) noexcept {
    if (broken_ || short_of_memory_) return;
    Sent(PQsendQueryParams(connection_, sql, 0, nullptr, nullptr, nullptr, nullptr, 0));
}

void Wire::SendQuery(const char* sql, const Values& values, bool binary_results) noexcept {
    const AtOnce whole(*this, values);
    if (broken_ || short_of_memory_) return;
    Sent(PQsendQueryParams(connection_, sql, static_cast<int>(values.data.size()), nullptr, values.data.data(),
                           values.lengths.data(), values.formats.data(), binary_results));
}

// What libpq cannot send at once it moves to the front of its buffer, each time, unless it may wait. Long values it waits
// for, and takes what the server says meanwhile; it does so from an empty buffer on.
Wire::AtOnce::AtOnce(Wire& wire, const Values& values) noexcept : wire_(wire) {
    std::int64_t bytes = 0;
    for (std::size_t index = 0; index < values.data.size(); ++index) bytes += values.data[index] ? values.lengths[index] : 0;
    if (bytes <= kLong || wire.broken_ || wire.short_of_memory_) return;
    int left = 1;
    while ((left = PQflush(wire.connection_)) == 1 && wire.Wait()) continue;
    waits_ = left == 0 && PQsetnonblocking(wire.connection_, 0) == 0;
    wire.broken_ = !waits_;
}

Wire::AtOnce::~AtOnce() {
    if (waits_ && PQsetnonblocking(wire_.connection_, 1) != 0) wire_.broken_ = true;
}

void Wire::SendPrepare(const char* name, const char* sql, std::span<const Oid> types) noexcept {
    if (broken_ || short_of_memory_) return;
    Sent(PQsendPrepare(connection_, name, sql, static_cast<int>(types.size()), types.data()));
}

void Wire::SendDescribe(const char* name) noexcept {
    if (broken_ || short_of_memory_) return;
    Sent(PQsendDescribePrepared(connection_, name));
}

void Wire::SendExecute(const char* name, const Values& values, bool binary_results) noexcept {
    const AtOnce whole(*this, values);
    if (broken_ || short_of_memory_) return;
    Sent(PQsendQueryPrepared(connection_, name, static_cast<int>(values.data.size()), values.data.data(),
                             values.lengths.data(), values.formats.data(), binary_results));
}

// Without its end a batch cannot be read: the connection is of no use then.
void Wire::Sync() noexcept {
    if (broken_) return;
    if (PQpipelineSync(connection_) != 1) {
        broken_ = true;
        return;
    }
    open_ = false;
    ++syncs_;
}

void Wire::Push() noexcept {
    if (broken_ || PQflush(connection_) != 1) return;
    PQconsumeInput(connection_);    // the server may wait for its answers to be taken
}

bool Wire::Closed() noexcept {
    pollfd place{PQsocket(connection_), POLLIN, 0};
    while (!broken_ && Idle() && poll(&place, 1, 0) == 1) broken_ = PQconsumeInput(connection_) != 1;
    return broken_;
}

// ---- Receiving

// Until something has come from the server, or there is nothing to wait for.
bool Wire::Wait() noexcept {
    const bool more = PQflush(connection_) == 1;
    const bool stopping = heeds_ && Asked();
    if (stopping && Clock::now() - cancelled_ > kBetweenCancels) Cancel();
    pollfd places[] = {{PQsocket(connection_), static_cast<short>(more ? POLLIN | POLLOUT : POLLIN), 0}, {wake_, POLLIN, 0}};
    // What libpq had no room for it has dropped, and may wait for for ever.
    const bool starves = std::strstr(PQerrorMessage(connection_), "out of memory") != nullptr;
    const auto end = stopping ? Clock::now() + kBetweenCancels : starves ? Clock::now() + kStarving : kForever;
    const int ready = poll(places, heeds_ ? 2 : 1, Milliseconds(end));
    if (ready < 0) return errno == EINTR;
    if (ready == 0 && starves && !stopping) broken_ = short_of_memory_ = true;
    if (broken_) return false;
    if (places[1].revents & POLLIN) {
        std::uint64_t count = 0;
        if (read(wake_, &count, sizeof count) < 0) count = 0;    // somebody else's wake was as good
    }
    return places[0].revents == 0 || PQconsumeInput(connection_) == 1;
}

Result Wire::Next() noexcept {
    if (broken_) return nullptr;
    if (Idle() && PQisBusy(connection_)) broken_ = short_of_memory_ = true;    // libpq had no room for an answer, and lost count
    if (broken_) return nullptr;
    while (PQisBusy(connection_) && Wait()) continue;
    if (broken_) return nullptr;
    Result result(PQgetResult(connection_));
    if (result && PQresultStatus(result.get()) == PGRES_PIPELINE_SYNC) --syncs_;
    if (PQstatus(connection_) == CONNECTION_BAD) broken_ = true;
    return result;
}

Status Wire::Answer(const PGresult* result, Verb verb) noexcept {
    const char* severity = PQresultErrorField(result, PG_DIAG_SEVERITY_NONLOCALIZED);
    const bool fatal = severity && (std::strcmp(severity, "FATAL") == 0 || std::strcmp(severity, "PANIC") == 0);
    broken_ = broken_ || fatal || PQstatus(connection_) == CONNECTION_BAD;
    if (!broken_) return Failure(result, verb);
    const char* words = PQresultErrorField(result, PG_DIAG_MESSAGE_PRIMARY);
    return loss_ = Refused(errors::kEndOfChannel, words ? words : "the connection to the server was lost");
}

Status Wire::Lost() noexcept {
    if (!loss_.Ok()) return Refused(errors::kNotConnected);
    return loss_ = Refused(errors::kEndOfChannel, "the connection to the server was lost");
}

const Status& Wire::Loss() noexcept {
    if (broken_ && loss_.Ok()) (void)Lost();
    return loss_;
}

// That the connection was lost is told when the batch is drained.
Status Wire::Pass(int commands) noexcept {
    Status first;
    while (commands > 0) {
        const Result result = Next();
        if (!result) --commands;
        else if (IsFailure(result.get()) && first.Ok()) first = Answer(result.get());
    }
    return first;
}

Status Wire::Drain(Result* last) noexcept {
    Status first;
    if (open_) Sync();
    while (syncs_ > 0 && !broken_) {
        Result result = Next();
        if (!result) continue;
        const ExecStatusType status = PQresultStatus(result.get());
        if (IsFailure(result.get())) {
            if (first.Ok()) first = Answer(result.get());
        } else if (last && status != PGRES_PIPELINE_SYNC && status != PGRES_PIPELINE_ABORTED) {
            *last = std::move(result);
        }
    }
    return AfterAll(std::move(first));
}

// What a batch ends with: that some of it could not be sent, or that the connection was lost, is told where no error was.
Status Wire::AfterAll(Status first) noexcept {
    if (std::exchange(short_of_memory_, false) && first.Ok()) first = Refused(errors::kOutOfMemory);
    return broken_ && first.Ok() ? Lost() : first;
}

// Where nothing is on its way the command goes without a pipeline: one message there and one answer, which the server is
// done with sooner than with the five of a pipeline.
Status Wire::Run(const char* sql, Result* last) noexcept {
    if (broken_) return Lost();
    if (!Idle() || short_of_memory_ || PQexitPipelineMode(connection_) != 1) {
        Send(sql);
        Sync();
        return Drain(last);
    }
    Sent(PQsendQuery(connection_, sql));
    Status first;
    for (Result result; (result = Next());) {
        if (!IsFailure(result.get())) {
            if (last) *last = std::move(result);
        } else if (first.Ok()) {
            first = Answer(result.get());
        }
    }
    open_ = false;
    broken_ = broken_ || PQenterPipelineMode(connection_) != 1;
    return AfterAll(std::move(first));
}

// A pipeline takes single commands alone.
void Wire::RunScript(const char* commands) noexcept {
    if (broken_ || !PQexitPipelineMode(connection_)) return;
    const Result result(PQexec(connection_, commands));
    if (IsFailure(result.get()) && Transaction() != PQTRANS_IDLE) Result(PQexec(connection_, "rollback"));
    broken_ = !Settle().Ok();
}

// ---- Stopping

void Wire::Wake() noexcept {
    const std::uint64_t one = 1;
    if (write(wake_, &one, sizeof one) < 0) return;    // so many wakes wait that one more says nothing
}

// Asked for by the thread that waits, so that it can meet no other call.
void Wire::Cancel() noexcept {
    cancelled_ = Clock::now();
    const std::unique_ptr<PGcancel, CancelDelete> cancel(PQgetCancel(connection_));
    char words[256];
    if (cancel) PQcancel(cancel.get(), words, sizeof words);
}

}  // namespace engine::postgres
