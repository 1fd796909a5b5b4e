// User sessions: begin and end.
#include "sessions/session.h"

#include <strings.h>

#include <optional>
#include <utility>

#include "handles/errors.h"
#include "sessions/server.h"

Session::~Session() { Drop(); }

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
    if (ShareLink()) return Error(errors::kAlreadyAuthenticated);
    Status status = Connect(server, credentials);
    if (status.Failed() || current_schema.empty()) return status;
    const Status preferred = UseSchema(current_schema);
    if (preferred.Failed()) Drop();
    return preferred.Failed() ? preferred : status;
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

// Where the user is the schema, his own is where the engine puts what he makes.
Status Session::UseSchema(std::string schema) {
    const Turn turn(*this);
    if (!turn.link) return {};
    Status status = turn.link->Engine().UseSchema(schema);
    const bool own = status.Number() == errors::kNoSuchSchema &&
                     strcasecmp(schema.c_str(), turn.link->user.c_str()) == 0;
    return own ? Status() : status;
}

Status Session::GetSchema(std::string& schema) const {
    schema = current_schema;
    const Turn turn(*this);
    return schema.empty() && turn.link ? turn.link->Engine().UseSchema(schema) : Status();
}

Status Session::End(GivingBack* released) {
    const Turn turn(*this);
    if (!turn.link) return Error(errors::kNotLoggedOn);
    Status status = turn.link->Commit();
    if (status.Failed() && !turn.link->Engine().Broken()) return status;    // a lost one has ended already
    turn.link->GiveBack(released ? std::move(*released) : GivingBack());
    Leave();
    return status;
}

// A server that took the place of the one before, and an end in another thread meanwhile, leave nothing to take.
Status Session::TakeOver(Session& from, Server& server) {
    const Turn turn(from);
    if (!turn.link || ShareLink()) return Error(errors::kNotLoggedOn);
    user = turn.link->user;
    if (!server.Join(*this, turn.link, turn.link->Database())) return Error(errors::kNotConnected);
    server_ = &server;
    link_.Set(turn.link);
    std::exchange(from.server_, nullptr)->Leave(from);
    from.link_.Set(nullptr);
    return {};
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
