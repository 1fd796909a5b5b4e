// Server handles: the database that user sessions are begun on.
//
// Threads: attaching, detaching and the attributes take turns by the server's own serial lock; links' locks come after
// it, never before. Sessions of one server begin and end in any thread.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include "engine/engine.h"
#include "handles/environment.h"
#include "handles/kept.h"

class Link;
class Session;
struct Connected;

// Where the sessions of a server get their connections from, when that is not the database itself: a pool.
class ConnectionSource {
public:
    virtual ~ConnectionSource() = default;
    [[nodiscard]] virtual const std::shared_ptr<engine::Database>& GetDatabase() const = 0;
    [[nodiscard]] virtual const std::string& DatabaseName() const = 0;
    // A connection of that user's. `connected` is set unless the call fails.
    virtual Status Take(const engine::Credentials& credentials, Connected& connected) = 0;
};

class Server : public Object {
public:
    static constexpr Kind kKind = Kind::server;
    explicit Server(const Origin& origin, bool own = false);
    ~Server() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override { return serial_; }
    [[nodiscard]] bool InUse() const override { return own_ || LastBegun().session; }

    [[nodiscard]] bool Attached() const;
    [[nodiscard]] const std::string& DatabaseName() const { return name_; }    // under the serial lock

    Status Attach(std::string_view database);
    Status Attach(std::shared_ptr<ConnectionSource> source);
    Status AttachLike(const Server& other);    // in the same mode, too; not to a pool
    Status Detach();    // sessions that are still begun are dropped: what they did not commit is rolled back

    // What is attached; null when nothing is.
    [[nodiscard]] std::shared_ptr<engine::Database> AttachedDatabase() const;

    // Connects a session: 3114 when nothing is attached.
    Status Connect(const engine::Credentials& credentials, std::shared_ptr<const engine::StopRequest> stop,
                   Connected& connected) const;

    // Sessions that are begun and not ended, and their links. A session cannot join when the server is no longer
    // attached to the database that it has connected to.
    [[nodiscard]] bool Join(Session& session, const std::shared_ptr<Link>& link, const engine::Database& database);
    void Leave(const Session& session) noexcept;
    [[nodiscard]] std::vector<std::shared_ptr<Link>> Links() const;

    const Birth birth;
    std::string internal_name;
    std::string external_name;
    std::string group;
    [[nodiscard]] bool NonBlocking() const { return non_blocking_.load(std::memory_order_relaxed); }
    void ToggleNonBlocking() noexcept { non_blocking_.store(!NonBlocking(), std::memory_order_relaxed); }

private:
    // Another thread may free the session meanwhile; it holds the link's serial lock while it does.
    struct BegunSession {
        Session* session = nullptr;
        std::shared_ptr<Link> link;
    };

    Status Attach(std::shared_ptr<engine::Database> database, std::string name,
                  std::shared_ptr<ConnectionSource> source);
    void DropSessions() noexcept;
    [[nodiscard]] BegunSession LastBegun() const;
    [[nodiscard]] bool Joined(const BegunSession& begun) const;

    std::atomic<bool> non_blocking_{false};
    const std::shared_ptr<std::recursive_mutex> serial_;    // null in an environment without threads
    const bool own_;    // made by a logon and below its service context
    mutable std::mutex mutex_;    // of what follows; nothing else is locked or called while it is held
    std::shared_ptr<engine::Database> database_;    // null when detached
    std::shared_ptr<ConnectionSource> source_;      // null: the database itself
    std::string name_;
    std::vector<BegunSession> sessions_;
};
