// Server handles: attaching and detaching.
#include "sessions/server.h"

#include <algorithm>
#include <utility>

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"
#include "sessions/session.h"

namespace {

Status GetNonBlocking(Server& server, AttributeValue& value) {
    value.integer = server.NonBlocking();
    return {};
}

// Each set toggles, whatever the value.
Status ToggleNonBlocking(Object& object, const AttributeValue&) {
    static_cast<Server&>(object).ToggleNonBlocking();
    return {};
}

Status GetStatus(Server& server, AttributeValue& value) {
    value.integer = server.Attached() ? OCI_SERVER_NORMAL : OCI_SERVER_NOT_CONNECTED;
    return {};
}

// Before the server is attached, and of at most 30 characters.
Status SetGroup(Server& server, const AttributeValue& value) {
    constexpr std::size_t kLongestGroup = 30;
    if (server.Attached()) return Error(errors::kGroupTooLate);
    if (value.text.size() > kLongestGroup) return Error(errors::kBadValue);
    server.group = value.text;
    return {};
}

// A failover callback is never called: an embedded database does not fail over.
Status TakeFailover(Object&, const AttributeValue&) { return {}; }

// Whether a call of another thread works on a session of the server. Without threads none does.
Status GetBusy(Server& server, AttributeValue& value) {
    for (const std::shared_ptr<Link>& link : server.Links()) {
        const SerialLock turn(link->Serial(), std::try_to_lock);
        if (!turn.Owns()) value.integer = 1;
    }
    return {};
}

Status GetInCurrentMode(Server&, AttributeValue& value) {
    value.integer = 1;
    return {};
}

Status GetDatabase(Server& server, AttributeValue& value) {
    value.text = server.DatabaseName();
    return {};
}

constexpr AttributeRow kRows[] = {
    {OCI_ATTR_NONBLOCKING_MODE, Shape::ub1, Get<Server, GetNonBlocking>, ToggleNonBlocking, 0, false},
    {OCI_ATTR_INTERNAL_NAME, Shape::text, GetText<&Server::internal_name>, SetText<&Server::internal_name>},
    {OCI_ATTR_EXTERNAL_NAME, Shape::text, GetText<&Server::external_name>, SetText<&Server::external_name>},
    {OCI_ATTR_FOCBK, Shape::handle, nullptr, TakeFailover},
    {OCI_ATTR_SERVER_GROUP, Shape::text, GetText<&Server::group>, Set<Server, SetGroup>},
    {OCI_ATTR_SERVER_STATUS, Shape::ub4, Get<Server, GetStatus>, nullptr},
    {OCI_ATTR_SERVER_BUSY, Shape::ub1, Get<Server, GetBusy>, nullptr},
    {OCI_ATTR_IN_V8_MODE, Shape::ub1, Get<Server, GetInCurrentMode>, nullptr},
    {OCI_ATTR_DBNAME, Shape::text, Get<Server, GetDatabase>, nullptr},
};

}  // namespace

Server::Server(const Origin& origin, bool own)
    : Object(origin), serial_(Env().Threaded() ? std::make_shared<std::recursive_mutex>() : nullptr), own_(own) {}

Server::~Server() { DropSessions(); }

std::span<const AttributeRow> Server::Attributes() const { return kRows; }

bool Server::Attached() const { return AttachedDatabase() != nullptr; }

std::shared_ptr<engine::Database> Server::AttachedDatabase() const {
    const std::lock_guard lock(mutex_);
    return database_;
}

bool Server::Join(Session& session, const std::shared_ptr<Link>& link, const engine::Database& database) {
    const std::lock_guard lock(mutex_);
    if (database_.get() != &database) return false;
    sessions_.push_back({&session, link});
    return true;
}

void Server::Leave(const Session& session) noexcept {
    const std::lock_guard lock(mutex_);
    std::erase_if(sessions_, [&session](const BegunSession& begun) { return begun.session == &session; });
}

std::vector<std::shared_ptr<Link>> Server::Links() const {
    const std::lock_guard lock(mutex_);
    std::vector<std::shared_ptr<Link>> links;
    for (const BegunSession& begun : sessions_) links.push_back(begun.link);
    return links;
}

Status Server::Attach(std::string_view database) {
    const SerialLock turn(serial_);
    if (Attached()) return Error(errors::kAlreadyAttached);
    std::unique_ptr<engine::Database> opened;
    Status status = engine::Open(database, opened);
    return status.Failed() ? status : Attach(std::move(opened), std::string(database), nullptr);
}

Status Server::Attach(std::shared_ptr<ConnectionSource> source) {
    const SerialLock turn(serial_);
    if (Attached()) return Error(errors::kAlreadyAttached);
    return Attach(source->GetDatabase(), source->DatabaseName(), source);
}

Status Server::AttachLike(const Server& other) {
    const SerialLock turn(serial_);
    if (Attached()) return Error(errors::kAlreadyAttached);
    std::shared_ptr<engine::Database> database = other.AttachedDatabase();
    if (!database) return Error(errors::kNotConnected);
    if (NonBlocking() != other.NonBlocking()) ToggleNonBlocking();
    return Attach(std::move(database), other.name_, nullptr);
}

Status Server::Attach(std::shared_ptr<engine::Database> database, std::string name,
                      std::shared_ptr<ConnectionSource> source) {
    name_ = std::move(name);
    const std::lock_guard lock(mutex_);
    database_ = std::move(database);
    source_ = std::move(source);
    return {};
}

Status Server::Connect(const engine::Credentials& credentials, std::shared_ptr<const engine::StopRequest> stop,
                       Connected& connected) const {
    std::shared_ptr<ConnectionSource> source;
    {
        const std::lock_guard lock(mutex_);
        connected.database = database_;
        source = source_;
    }
    if (!connected.database) return Error(errors::kNotConnected);
    if (source) return source->Take(credentials, connected);
    if (!credentials.external) connected.user = credentials.user;
    return connected.database->Connect(credentials, std::move(stop), connected.connection);
}

// No session joins any more once the database is taken away.
Status Server::Detach() {
    const SerialLock turn(serial_);
    std::shared_ptr<engine::Database> detached;
    std::shared_ptr<ConnectionSource> source;
    {
        const std::lock_guard lock(mutex_);
        detached = std::exchange(database_, nullptr);
        source = std::exchange(source_, nullptr);
    }
    if (!detached) return Error(errors::kNotConnected);
    DropSessions();
    name_.clear();
    return {};
}

Server::BegunSession Server::LastBegun() const {
    const std::lock_guard lock(mutex_);
    return sessions_.empty() ? BegunSession() : sessions_.back();
}

bool Server::Joined(const BegunSession& begun) const {
    const std::lock_guard lock(mutex_);
    return std::any_of(sessions_.begin(), sessions_.end(), [&begun](const BegunSession& joined) {
        return joined.session == begun.session && joined.link == begun.link;
    });
}

void Server::DropSessions() noexcept {
    for (BegunSession begun = LastBegun(); begun.session; begun = LastBegun()) {
        const SerialLock serial(begun.link->Serial());
        if (Joined(begun)) begun.session->Drop();    // else it is freed, or ended
    }
}
