// Service contexts: what they are put together from, and logon in one call.
#include "sessions/service_context.h"

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"

namespace {

Status GetServerHandle(ServiceContext& service, AttributeValue& value) {
    value.pointer = service.GetServer();
    return {};
}

Status GetSessionHandle(ServiceContext& service, AttributeValue& value) {
    value.pointer = service.GetSession();
    return {};
}

Status GetTransactionHandle(ServiceContext& service, AttributeValue& value) {
    value.pointer = service.GetTransaction();
    return {};
}

// A null pointer takes the handle out of the context; anything else must be a living handle of the kind.
template <class T, Status (ServiceContext::*setter)(T*)>
Status SetHandle(Object& object, const AttributeValue& value) {
    T* handle = Live<T>(value.pointer);
    if (value.pointer && !handle) return Error(errors::kBadValue);
    return (static_cast<ServiceContext&>(object).*setter)(handle);
}

// The mode is the server's; each set toggles it, whatever the value.
Status GetNonBlocking(ServiceContext& service, AttributeValue& value) {
    Server* server = nullptr;
    Status status = service.RequireServer(server);
    if (status.Ok()) value.integer = server->NonBlocking();
    return status;
}
Status ToggleNonBlocking(Object& object, const AttributeValue&) {
    Server* server = nullptr;
    Status status = static_cast<ServiceContext&>(object).RequireServer(server);
    if (status.Ok()) server->ToggleNonBlocking();
    return status;
}

Status SetCacheSize(ServiceContext& service, const AttributeValue& value) {
    service.statement_cache_size = static_cast<std::uint32_t>(value.integer);
    return {};
}

Status GetInCurrentMode(ServiceContext& service, AttributeValue& value) {
    value.integer = service.Lent() ? 0 : 1;
    return {};
}

using S = ServiceContext;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_SERVER, Shape::handle, Get<S, GetServerHandle>, SetHandle<Server, &S::SetServer>},
    {OCI_ATTR_SESSION, Shape::handle, Get<S, GetSessionHandle>, SetHandle<Session, &S::SetSession>},
    {OCI_ATTR_TRANS, Shape::handle, Get<S, GetTransactionHandle>, SetHandle<TransactionHandle, &S::SetTransaction>},
    {OCI_ATTR_STMTCACHESIZE, Shape::ub4, GetField<&S::statement_cache_size>, Set<S, SetCacheSize>},
    {OCI_ATTR_NONBLOCKING_MODE, Shape::ub1, Get<S, GetNonBlocking>, ToggleNonBlocking, 0, false},
    {OCI_ATTR_IN_V8_MODE, Shape::ub1, Get<S, GetInCurrentMode>, nullptr},
};

// The own server's, of a logon that may come to nothing: its error, or lack of memory, is what counts then.
class Attachment {
public:
    explicit Attachment(Server& server) : server_(&server) {}
    ~Attachment() { if (server_) (void)server_->Detach(); }
    Attachment(const Attachment&) = delete;
    Attachment& operator=(const Attachment&) = delete;
    void Keep() noexcept { server_ = nullptr; }

private:
    Server* server_;
};

}  // namespace

ServiceContext::ServiceContext(const Origin& origin)
    : Object(origin), changing_(Env().Threaded() ? std::make_shared<std::recursive_mutex>() : nullptr) {}

std::span<const AttributeRow> ServiceContext::Attributes() const { return kRows; }

std::shared_ptr<std::recursive_mutex> ServiceContext::Serial() {
    Session* session = GetSession();
    return session ? session->Serial() : nullptr;
}

Status ServiceContext::RequireServer(Server*& server) {
    server = GetServer();
    return server && server->Attached() ? Status() : Error(errors::kNotConnected);
}

Status ServiceContext::Require(std::shared_ptr<Link>& link) {
    link = nullptr;
    if (lent_) return Error(errors::kNoModeSwitch);
    const Session* session = GetSession();
    link = session ? session->ShareLink() : nullptr;
    if (link) return {};
    Server* server = nullptr;
    Status status = RequireServer(server);
    return status.Failed() ? status : Error(errors::kNotLoggedOn);
}

Status ServiceContext::SetServer(Server* server) {
    if (logged_on_) return Error(errors::kReadOnly);
    server_.Set(server);
    return {};
}

Status ServiceContext::SetSession(Session* session) {
    if (logged_on_) return Error(errors::kReadOnly);
    session_.Set(session);
    return {};
}

Status ServiceContext::SetTransaction(TransactionHandle* transaction) {
    transaction_.Set(transaction);
    return {};
}

Server& ServiceContext::OwnServer() {
    if (!own_server_) own_server_ = Create<Server>(*this, OCI_HTYPE_SERVER, 0, true);
    return *own_server_;
}

Session& ServiceContext::OwnSession() {
    const SerialLock changing(changing_);
    if (!own_session_) own_session_ = Create<Session>(*this, OCI_HTYPE_SESSION, 0, true);
    return *own_session_;
}

Status ServiceContext::LogOn(const Target& target, const engine::Credentials& credentials, EndedBy ended_by) {
    const SerialLock changing(changing_);
    if (Status status = EndFormer(); status.Failed()) return status;
    Server& server = OwnServer();
    Session& session = OwnSession();
    Status status = target.source ? server.Attach(target.source) : server.Attach(target.database);
    if (status.Failed()) return status;
    Attachment attachment(server);
    status = session.Begin(server, credentials);
    if (status.Failed()) return status;
    if (const std::shared_ptr<Link> link = session.ShareLink()) session.user = link->user;
    attachment.Keep();
    server_.Set(&server);
    session_.Set(&session);
    obtained_ = ended_by == EndedBy::release;
    logged_on_ = true;
    return status;
}

Status ServiceContext::EndFormer() {
    if (lent_) return Error(errors::kNoModeSwitch);
    if (!logged_on_) return {};
    Status ended = LogOff();
    return logged_on_ ? ended : Status();
}

Status ServiceContext::LogOff() {
    const SerialLock changing(changing_);
    if (obtained_) return Error(errors::kMustRelease);
    Session* session = GetSession();
    std::shared_ptr<Link> link;
    Status status = Require(link);
    if (status.Failed()) return status;
    status = session ? session->End() : Error(errors::kNotLoggedOn);
    if (!logged_on_ || (status.Failed() && session && session->Begun())) return status;
    const Status detached = Forget();
    return status.Failed() ? status : detached;
}

Status ServiceContext::Release(GivingBack how) {
    const SerialLock changing(changing_);
    if (!obtained_) return Error(errors::kCannotRelease);
    if (lent_) return Error(errors::kNoModeSwitch);
    Status status = own_session_->End(&how);
    if (status.Failed() && own_session_->Begun()) return status;
    const Status detached = Forget();
    return status.Failed() ? status : detached;
}

Status ServiceContext::Lend(std::weak_ptr<const void>& loan) {
    const SessionTurn turn(*this);
    if (!turn.link) return turn.status;
    if (lent_) return Error(errors::kNoModeSwitch);    // while the lock was waited for
    auto made = std::make_shared<int>();
    loan = made;
    loan_ = std::move(made);
    lent_ = true;
    return {};
}

void ServiceContext::TakeBack() noexcept {
    const SerialLock lock(Serial());
    lent_ = false;
    loan_.reset();
}

Status ServiceContext::TakeOver(ServiceContext& from) {
    const SerialLock changing(changing_);
    if (Status status = EndFormer(); status.Failed()) return status;
    Server& server = OwnServer();
    Session& session = OwnSession();
    Status status = server.AttachLike(*from.own_server_);
    if (status.Failed()) return status;
    Attachment attachment(server);
    status = session.TakeOver(*from.own_session_, server);
    if (status.Failed()) return status;
    attachment.Keep();
    server_.Set(&server);
    session_.Set(&session);
    logged_on_ = true;
    (void)from.Forget();
    return {};
}

Status ServiceContext::Forget() {
    statement_cache_size = 0;
    server_.Set(nullptr);
    session_.Set(nullptr);
    logged_on_ = false;
    obtained_ = false;
    return own_server_->Detach();
}

bool ServiceContext::IsOfObtained(const Object& own) {
    const Object* parent = own.Parent();
    return parent->Type() == OCI_HTYPE_SVCCTX && static_cast<const ServiceContext*>(parent)->Obtained();
}

SessionTurn::SessionTurn(ServiceContext& service) {
    for (status = service.Require(link); status.Ok(); status = service.Require(link)) {
        lock_.emplace(link->Serial());
        if (!link->Closed()) return;
        lock_.reset();    // the session ended while its lock was waited for
    }
}
