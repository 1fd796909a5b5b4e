// Calls that are left unfinished (non-blocking mode): what executes or fetches runs in a thread of its own, and the call
// answers 3123 until the same function on the same cursor finds it done. The area is written by that call alone.
#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>

#include "legacy/call.h"
#include "sessions/link.h"

namespace legacy {

class UnfinishedCall {
public:
    UnfinishedCall(const Cursor& cursor, Function function, const Cda_Def& area, std::shared_ptr<Link> link)
        : area(area), cursor_(cursor), function_(function), link_(std::move(link)) {}
    ~UnfinishedCall() { if (thread_.joinable()) thread_.join(); }
    UnfinishedCall(const UnfinishedCall&) = delete;
    UnfinishedCall& operator=(const UnfinishedCall&) = delete;

    // Throws std::system_error where there is no thread for it.
    template <class Body>
    void Start(Cursor& cursor, const Body& body) {
        thread_ = std::thread([this, &cursor, body] {
            const int result = Guarded([&] { return body(cursor, area); });
            const std::lock_guard lock(mutex_);
            result_ = result;
            done_ = true;
            ended_.notify_all();
        });
    }
    [[nodiscard]] bool Is(const Cursor& cursor, Function function) const {
        return &cursor == &cursor_ && function == function_;
    }
    void Stop() noexcept { link_->Cancel(); }
    // Whether it has ended, or does within a moment.
    [[nodiscard]] bool Ended(int& result) {
        std::unique_lock lock(mutex_);
        if (!ended_.wait_for(lock, kMoment, [this] { return done_; })) return false;
        result = result_;
        return true;
    }

    Cda_Def area;    // what the call leaves in the application's

private:
    static constexpr std::chrono::milliseconds kMoment{5};

    const Cursor& cursor_;
    const Function function_;
    const std::shared_ptr<Link> link_;    // that it runs on
    std::mutex mutex_;    // of what follows
    std::condition_variable ended_;
    bool done_ = false;
    int result_ = 0;
    std::thread thread_;
};

// The link on which calls of the login may be left unfinished, by its mode and the engine; else null.
std::shared_ptr<Link> LinkToLeave(const Login& login) noexcept;

// For the calls that execute or fetch; body(Cursor&, Cda_Def&), copied, refers to nothing of the call.
template <class Body>
sword OnRunningStatement(Cda_Def* area, Function function, const Body& body) noexcept {
    const auto run = [&](Cursor& cursor) -> int {
        Login& login = *cursor.login;
        if (!login.unfinished) {
            if (!cursor.parsed) return errors::kNotParsed;
            std::shared_ptr<Link> link = LinkToLeave(login);
            if (!link) return body(cursor, *area);
            login.unfinished = std::make_unique<UnfinishedCall>(cursor, function, *area, std::move(link));
            try {
                login.unfinished->Start(cursor, body);
            } catch (const std::exception&) {    // no thread: the call takes as long as it takes
                login.unfinished = nullptr;
                return body(cursor, *area);
            }
        }
        int result = 0;
        if (!login.unfinished->Ended(result)) return errors::kStillExecuting;
        const std::unique_ptr<UnfinishedCall> ended = std::move(login.unfinished);
        area->rpc = ended->area.rpc;
        area->peo = ended->area.peo;
        area->rid = ended->area.rid;
        return result;
    };
    return OnCursor(area, function, run);
}

}  // namespace legacy
