// Pools of connections, each with the user who is logged on and what is cached with it. Session pools and connection
// pools are the same here: a session has a connection to itself from its begin to its end, since the connection of an
// engine is one user's. They differ in who is logged on, in what a caller asks for, and in their error numbers.
//
// A connection's place (PoolPlace) travels with it, and the pool lives as long as a place. Connections rest in the pool
// in the order in which they came back; the last one is given first, so that the others may grow old.
//
// Threads: everything from any thread. The lock is held for counting and moving alone: never while an engine works, and
// never while something is made or destroyed. Who waits does so in a queue; the first one is woken, and only he may take
// what is there.
#pragma once

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <list>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

#include "engine/engine.h"
#include "handles/status.h"
#include "sessions/link.h"
#include "sessions/server.h"

class Pool;

struct PoolSize {
    std::uint32_t least = 0;
    std::uint32_t most = 0;
    std::uint32_t step = 0;
};

// What attributes of the handle say; they may change at any time, before the pool is created as well.
struct PoolSettings {
    std::atomic<std::uint32_t> idle_seconds{0};         // 0: connections rest as long as the pool lives
    std::atomic<std::uint8_t> get_mode{0};              // OCI_SPOOL_ATTRVAL_*
    std::atomic<std::uint32_t> wait_milliseconds{0};    // of a timed wait
    std::atomic<std::uint32_t> cache_size{0};           // of the statement cache of sessions
};

// What a pool is made of, for good.
struct PoolPlan {
    std::shared_ptr<engine::Database> database;
    std::string database_name;
    engine::Credentials own;     // of the pool
    bool one_user = false;       // all sessions are the own user's, whoever is named
    bool may_wait = false;       // there are other threads to wait for
    int none_left = 0;           // the numbers of: exhausted, and nobody may wait;
    int gone = 0;                // there is no such pool (any more)
};

// What a session is wanted for.
struct SessionWish {
    std::string tag;
    bool any_tag = false;    // rather another tag than a new connection
    bool fresh = false;      // nobody was logged on with it before
};

class PoolPlace final : public LinkPlace {
public:
    PoolPlace(std::shared_ptr<Pool> pool, engine::Credentials credentials);
    ~PoolPlace() override;
    PoolPlace(const PoolPlace&) = delete;
    PoolPlace& operator=(const PoolPlace&) = delete;
    [[nodiscard]] bool Serve(Session& session, const std::shared_ptr<Link>& link) noexcept override;
    void TakeBack(Connected connected, GivingBack how) noexcept override;
    [[nodiscard]] const std::string& Tag() const { return tag_; }

private:
    friend class Pool;
    // A connection that rests. Made with the place, so that coming back needs no memory.
    struct Resting {
        Connected connected;
        std::chrono::steady_clock::time_point since;
    };

    const std::shared_ptr<Pool> pool_;
    const engine::Credentials credentials_;
    std::string tag_;
    bool used_ = false;
    std::list<Resting> node_;    // one, empty; in the pool's list while the connection rests
    // Under the pool's lock: whether the connection is in use, and by whom once a session has begun.
    bool busy_ = false;
    PoolPlace* previous_ = nullptr;
    PoolPlace* next_ = nullptr;
    Session* session_ = nullptr;
    std::weak_ptr<Link> link_;
};

class Pool : public std::enable_shared_from_this<Pool> {
public:
    Pool(PoolPlan plan, PoolSize size, std::shared_ptr<const PoolSettings> settings);

    [[nodiscard]] const PoolPlan& Plan() const { return plan_; }
    [[nodiscard]] const PoolSettings& Settings() const { return *settings_; }
    struct Counts {
        std::uint32_t open = 0;
        std::uint32_t busy = 0;
        PoolSize size;
    };
    Counts Count() noexcept;

    // Opens what is missing to the least number: 24414 when some could not be opened, their error when none could.
    Status Fill();
    // Those beyond the new most are closed as they come back.
    void Resize(const PoolSize& size) noexcept;
    Status Take(const engine::Credentials& credentials, const SessionWish& wish, Connected& connected);

    // The end. Who waits is woken and told so; nothing is given any more. What rests goes with the second call, what is
    // in use when it comes back, or with the third, which rolls back. Close is refused while somebody uses the pool.
    void Stop() noexcept;
    void Close() noexcept;
    void DropSessions() noexcept;
    [[nodiscard]] bool StopUnlessUsed() noexcept;

private:
    friend class PoolPlace;
    using Lock = std::unique_lock<std::mutex>;
    using RestingList = std::list<PoolPlace::Resting>;
    class Opening;
    struct Waiter {
        std::condition_variable turn;
        Waiter* next = nullptr;
    };

    static PoolPlace& PlaceOf(const Connected& connected) { return static_cast<PoolPlace&>(*connected.place); }
    // All of these under the lock.
    [[nodiscard]] std::uint32_t Total() const;
    [[nodiscard]] bool Available() const { return !resting_.empty() || Total() < size_.most; }
    Status AwaitTurn(Lock& lock);
    Status Wait(Lock& lock, bool timed);
    void Leave(Waiter& waiter) noexcept;
    void WakeNext() noexcept;
    void StopAll() noexcept;
    RestingList::iterator Choose(const engine::Credentials& credentials, const SessionWish& wish);
    void TakeExpired(RestingList& expired) noexcept;
    void Enter(PoolPlace& place) noexcept;
    void Exit(PoolPlace& place) noexcept;

    const engine::Credentials& WhoBegins(const engine::Credentials& named) const;
    Status TakeOrReserve(const engine::Credentials& credentials, const SessionWish& wish, Connected& connected,
                         std::uint32_t& to_open);
    Status Connect(const engine::Credentials& credentials, Connected& connected);
    bool NextToDrop(Session*& session, std::shared_ptr<Link>& link) noexcept;
    bool Serves(const Link& link) noexcept;

    const PoolPlan plan_;
    const std::shared_ptr<const PoolSettings> settings_;
    std::mutex mutex_;    // of what follows
    PoolSize size_;
    bool stopped_ = false;
    RestingList resting_;          // the longest resting first
    std::uint32_t busy_ = 0;
    std::uint32_t opening_ = 0;    // places promised to connections that are being opened
    PoolPlace* first_busy_ = nullptr;
    Waiter* first_waiter_ = nullptr;
    Waiter* last_waiter_ = nullptr;
};

// A server's way to a pool, with a wish for its sessions.
class PoolSource final : public ConnectionSource {
public:
    PoolSource(std::shared_ptr<Pool> pool, SessionWish wish) : pool_(std::move(pool)), wish_(std::move(wish)) {}
    [[nodiscard]] const std::shared_ptr<engine::Database>& GetDatabase() const override {
        return pool_->Plan().database;
    }
    [[nodiscard]] const std::string& DatabaseName() const override { return pool_->Plan().database_name; }
    Status Take(const engine::Credentials& credentials, Connected& connected) override {
        return pool_->Take(credentials, wish_, connected);
    }

private:
    const std::shared_ptr<Pool> pool_;
    const SessionWish wish_;
};
