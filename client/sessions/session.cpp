// User sessions: begin and end.
#include "sessions/session.h"

#include <optional>
#include <utility>

#include "handles/attributes.h"
#include "handles/errors.h"
#include "oci.h"
#include "sessions/server.h"

namespace {

Status GetOpenStatements(Session& session, AttributeValue& value) {
    const std::shared_ptr<Link> link = session.ShareLink();
    value.integer = link ? link->open_statements : 0;
    return {};
}

// Kept, so that applications written for it run; there is nothing here that it would choose.
Status TakeAny(Object&, const AttributeValue&) { return {}; }

using S = Session;
constexpr AttributeRow kRows[] = {
    {OCI_ATTR_USERNAME, Shape::text, GetText<&S::user>, SetText<&S::user>},
    {OCI_ATTR_PASSWORD, Shape::text, nullptr, SetText<&S::password>},
    {OCI_ATTR_NUM_OPEN_STMTS, Shape::ub4, Get<S, GetOpenStatements>, nullptr},
    {OCI_ATTR_CLIENT_IDENTIFIER, Shape::text, nullptr, SetText<&S::client_identifier>},
    {OCI_ATTR_MODULE, Shape::text, nullptr, SetText<&S::module>},
    {OCI_ATTR_ACTION, Shape::text, nullptr, SetText<&S::action>},
    {OCI_ATTR_CLIENT_INFO, Shape::text, nullptr, SetText<&S::client_info>},
    {OCI_ATTR_DRIVER_NAME, Shape::text, nullptr, SetText<&S::driver_name>},
    {OCI_ATTR_CONNECTION_CLASS, Shape::text, GetText<&S::connection_class>, SetText<&S::connection_class>},
    {OCI_ATTR_CURRENT_SCHEMA, Shape::text, GetText<&S::current_schema>, SetText<&S::current_schema>},
    {OCI_ATTR_EDITION, Shape::text, GetText<&S::edition>, SetText<&S::edition>},
    {OCI_ATTR_PURITY, Shape::ub4, GetField<&S::purity>, SetField<&S::purity>},
    {OCI_ATTR_MIGSESSION, Shape::handle, nullptr, TakeAny},
    {OCI_ATTR_PROXY_CREDENTIALS, Shape::handle, nullptr, TakeAny},
    {OCI_ATTR_INITIAL_CLIENT_ROLES, Shape::handle, nullptr, TakeAny},
};

}  // namespace

Session::~Session() { Drop(); }

std::span<const AttributeRow> Session::Attributes() const { return kRows; }

std::shared_ptr<std::recursive_mutex> Session::Serial() { return link_.Serial(); }

// The link of the moment, locked: null when the session is not begun. The session may have ended, and begun on another
// link, while the lock was waited for.
class Session::Turn {
public:
    explicit Turn(const Session& session) {
        for (link = session.ShareLink(); link; link = session.ShareLink()) {
            lock_.emplace(link->Serial());
            if (session.ShareLink() == link) return;
            lock_.reset();
        }
    }
    std::shared_ptr<Link> link;

private:
    std::optional<SerialLock> lock_;    // given up before the link
};

Status Session::Begin(Server& server, const engine::Credentials& credentials) {
    if (beginning_.exchange(true)) return Error(errors::kAlreadyAuthenticated);
    struct Done {
        std::atomic<bool>& beginning;
        ~Done() { beginning = false; }
    } const done{beginning_};
    return ShareLink() ? Error(errors::kAlreadyAuthenticated) : Connect(server, credentials);
}

// A session that cannot join gives the connection back.
Status Session::Connect(Server& server, const engine::Credentials& credentials) {
    auto link = std::make_shared<Link>(Env().Threaded());
    Connected connected;
    Status status = server.Connect(credentials, link->Stop(), connected);
    if (status.Failed()) return status;
    link->Open(std::move(connected));
    struct Undo {
        Link* link;
        ~Undo() { if (link) link->GiveBack({}); }
    } undo{link.get()};
    const SerialLock serial(link->Serial());
    if (!server.Join(*this, link, link->Database())) return Error(errors::kNotConnected);
    if (link->Place() && !link->Place()->Serve(*this, link)) {
        server.Leave(*this);
        return Error(errors::kNotConnected);
    }
    undo.link = nullptr;
    server_ = &server;
    link_.Set(std::move(link));
    return status;
}

Status Session::End(GivingBack* released) {
    const Turn turn(*this);
    if (!turn.link) return Error(errors::kNotLoggedOn);
    Status status = turn.link->Commit();
    if (status.Failed() && !(released && turn.link->Engine().Broken())) return status;
    turn.link->GiveBack(released ? std::move(*released) : GivingBack());
    Leave();
    return status;
}

Status Session::ChangePassword(const std::string& user_name, const std::string& old_password,
                               const std::string& new_password) {
    const Turn turn(*this);
    if (!turn.link) return Error(errors::kNotLoggedOn);
    return turn.link->Engine().ChangePassword(user_name, old_password, new_password);
}

void Session::Drop() noexcept {
    const Turn turn(*this);
    if (!turn.link) return;
    turn.link->Close();
    Leave();
}

void Session::Leave() noexcept {
    std::exchange(server_, nullptr)->Leave(*this);
    link_.Set(nullptr);    // last: who frees the session waits for the lock as long as it has a link
}
