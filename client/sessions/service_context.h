// Service contexts, servers, user sessions and transaction handles. A service context brings a server, a session and a
// transaction handle together; statements run on its link. A logon makes server and session of its own below the context
// and keeps them for the next logon on the same context.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "handles/environment.h"
#include "handles/object.h"
#include "sessions/link.h"

// The database a server handle is attached to.
class Server : public Object {
public:
    static constexpr Kind kKind = Kind::server;
    explicit Server(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] bool InUse() const override { return sessions > 0; }

    [[nodiscard]] bool Attached() const { return attached_; }
    [[nodiscard]] const std::string& Database() const { return database_; }
    Status Attach(std::string_view database);
    Status Detach();
    // A connection for a new session: the one that attaching opened, or a further one.
    Status TakeConnection(std::unique_ptr<engine::Connection>& connection);
    void GiveBack(std::unique_ptr<engine::Connection> connection) noexcept;
    std::string VersionText();    // of the engine; attached servers only
    Status Probe();               // one empty round trip

    std::string internal_name;
    std::string external_name;
    std::string group;
    bool non_blocking = false;
    std::uint32_t sessions = 0;    // begun and not ended

private:
    bool attached_ = false;
    std::string database_;
    std::unique_ptr<engine::Connection> spare_;
    std::string version_;
};

class Session : public Object {
public:
    static constexpr Kind kKind = Kind::session;
    explicit Session(const Origin& origin) : Object(origin) {}
    ~Session() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    [[nodiscard]] bool Begun() const { return link_ != nullptr; }
    [[nodiscard]] const std::shared_ptr<Link>& GetLink() const { return link_; }
    Status Begin(Server& server, bool external);
    Status End(bool commit);

    std::string user;
    std::string password;
    bool has_user = false;        // set, though perhaps empty
    bool has_password = false;
    std::string client_identifier, module, action, client_info, driver_name, connection_class, current_schema, edition;
    std::uint32_t purity = 0;

private:
    std::shared_ptr<Link> link_;
    Server* server_ = nullptr;
};

// A transaction handle: what names a global branch. The transactions themselves are elsewhere.
class Transaction : public Object {
public:
    static constexpr Kind kKind = Kind::transaction;
    static constexpr std::size_t kXidSize = 140;
    explicit Transaction(const Origin& origin) : Object(origin) {}
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;

    std::string xid;     // kXidSize bytes once set
    std::string name;
    std::uint32_t timeout = 0;
};

class ServiceContext : public Object {
public:
    static constexpr Kind kKind = Kind::service_context;
    explicit ServiceContext(const Origin& origin) : Object(origin) {}
    ~ServiceContext() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    // The link that statements run on: error 3114 without an attached server, 1012 before a session is begun.
    Status Require(std::shared_ptr<Link>& link);

    Server* AttachedServer() const;    // null: none set, freed meanwhile, or not attached
    Session* CurrentSession() const;
    Transaction* CurrentTransaction() const;

    Status LogOn(std::string_view database, const engine::Credentials& credentials, bool statement_cache);
    Status LogOff();    // commits

    void* server = nullptr;         // as the application set them; checked at use
    void* session = nullptr;
    void* transaction = nullptr;
    std::uint32_t statement_cache_size = 0;    // 0: no cache
    bool logged_on = false;         // by a logon call: server and session are read-only

private:
    Server* own_server_ = nullptr;      // children, made by the first logon
    Session* own_session_ = nullptr;
};
