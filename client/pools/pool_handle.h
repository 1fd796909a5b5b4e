// Pool handles: what an application creates, asks and destroys. The two kinds differ in their attributes and in the
// numbers of their errors, which are a row each (PoolNumbers). A pool that is created has a name of its own, by which
// the sessions of its environment find it.
//
// Threads: everything from any thread. The lock guards which pool the handle has; nothing is made, waited for or
// destroyed under it.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

#include "handles/environment.h"
#include "handles/object.h"
#include "pools/pool.h"

// The published errors of one kind of pool.
struct PoolNumbers {
    int exists;
    int none_to_reinitialize;
    int bad_size;
    int in_use;
    int none_left;
    int none_of_that_name;
    // What a create answers in place of a failing attach or logon; 0: the engine's own number.
    int bad_database;
    int bad_user;
};

class PoolHandle : public Object {
public:
    ~PoolHandle() override;
    [[nodiscard]] bool InUse() const override;
    void Withdrawn() noexcept override;

    // What a create asks for.
    struct Request {
        std::string database;
        engine::Credentials own;
        PoolSize size;
        bool one_user = false;    // every session is the pool's own user's
        bool fill = false;        // opens the least number of connections
        bool caches = false;      // statements, where no size was set
    };
    Status CreatePool(Request request);
    Status Reinitialize(const PoolSize& size);
    Status DestroyPool(bool force);

    [[nodiscard]] std::shared_ptr<Pool> GetPool() const;    // null when none is created
    [[nodiscard]] PoolSettings& Settings() const { return *settings_; }
    // As the application reads it; as long as the pool is not destroyed.
    [[nodiscard]] std::string_view Name() const { return shown_name_; }

protected:
    PoolHandle(const Origin& origin, const PoolNumbers& numbers)
        : Object(origin), numbers_(numbers), settings_(std::make_shared<PoolSettings>()) {}

private:
    Status MakePool(Request& request, std::shared_ptr<Pool>& pool) const;
    Status CheckSize(const PoolSize& size) const;
    [[nodiscard]] std::shared_ptr<Pool> Part() noexcept;

    const PoolNumbers& numbers_;
    const std::shared_ptr<PoolSettings> settings_;
    std::string shown_name_;
    mutable std::mutex mutex_;    // of what follows
    bool creating_ = false;
    std::shared_ptr<Pool> pool_;
    std::string name_;
};

class ConnectionPool final : public PoolHandle {
public:
    static constexpr Kind kKind = Kind::connection_pool;
    explicit ConnectionPool(const Origin& origin);
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};

class SessionPool final : public PoolHandle {
public:
    static constexpr Kind kKind = Kind::session_pool;
    explicit SessionPool(const Origin& origin);
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
};

// The pool of a name in an environment: 24392 or 24416 when there is none of the kind.
Status FindPool(const Environment& environment, Kind kind, std::string_view name, std::shared_ptr<Pool>& pool);
