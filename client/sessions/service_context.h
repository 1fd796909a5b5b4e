// Service contexts: a server, a user session and a transaction handle together; statements run on the session's link. A
// logon makes a server and a session of its own below the context and keeps them for the next logon on the same
// context.
//
// Threads: what the context is put together from is read at any time, from any thread (OCIBreak). Logging on and off
// takes turns by a lock of the context's own, which comes before any other. What works on the session holds the serial
// lock of its link (SessionTurn, or the gate).
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "handles/kept.h"
#include "sessions/link.h"
#include "sessions/server.h"
#include "sessions/session.h"
#include "sessions/transaction_handle.h"

class ServiceContext : public Object {
public:
    static constexpr Kind kKind = Kind::service_context;
    static constexpr std::uint32_t kDefaultCacheSize = 20;

    explicit ServiceContext(const Origin& origin);
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;

    // The link that statements run on: error 3114 without an attached server, 1012 before a session is begun, 24406
    // while the context is lent.
    Status Require(std::shared_ptr<Link>& link);
    // The attached server, whether or not a session is begun: else 3114.
    Status RequireServer(Server*& server);

    // What the application set; null when it is freed meanwhile.
    [[nodiscard]] Server* GetServer() const { return server_.Get(); }
    [[nodiscard]] Session* GetSession() const { return session_.Get(); }
    [[nodiscard]] TransactionHandle* GetTransaction() const { return transaction_.Get(); }
    Status SetServer(Server* server);       // refused (24309) on a context that is logged on by a logon call
    Status SetSession(Session* session);
    Status SetTransaction(TransactionHandle* transaction);

    [[nodiscard]] bool LoggedOn() const { return logged_on_; }
    // What a logon attaches the context's own server to.
    struct Target {
        std::string_view database;
        std::shared_ptr<ConnectionSource> source;    // null: the database
    };
    // Who is to end the session: a logoff, or the release of what OCISessionGet gave.
    enum class EndedBy : std::uint8_t { logoff, release };
    Status LogOn(const Target& target, const engine::Credentials& credentials, EndedBy ended_by);
    Status LogOff();    // commits; an error leaves the session as it was. 24420 when it is to be released
    // The same; 24421 when nothing is to be released. A session that broke, or is gone, is ended all the same.
    Status Release(GivingBack how);
    [[nodiscard]] bool Obtained() const { return obtained_; }    // to be released
    // Gives the session to calls of another kind until it is taken back: nobody else uses it through this context. The
    // loan lasts as long as `loan` is not expired, which the end of the context ends, too.
    Status Lend(std::weak_ptr<const void>& loan);
    void TakeBack() noexcept;
    [[nodiscard]] bool Lent() const { return lent_; }
    // Logs on with the session of a context that is logged on by itself, which is logged off then; its transaction goes
    // on. An own session is ended first, as by LogOn.
    Status TakeOver(ServiceContext& from);
    // Whether a server or a session is the own one of such a context.
    [[nodiscard]] static bool IsOfObtained(const Object& own);
    // The session that the context is to be used with when the application set none: the context's own.
    Session& OwnSession();

    std::atomic<std::uint32_t> statement_cache_size{0};    // 0: no cache

    std::string tag;    // of the session that was got, as the application reads it
    const Birth birth;

private:
    Server& OwnServer();
    Status Forget();    // the session has ended
    Status EndFormer();    // before a logon

    Kept<Server> server_;
    Kept<Session> session_;
    Kept<TransactionHandle> transaction_;
    std::atomic<bool> logged_on_{false};            // by a logon call: server and session are read-only
    std::atomic<bool> obtained_{false};
    std::atomic<bool> lent_{false};
    std::shared_ptr<const void> loan_;    // under the serial lock of the session
    const std::shared_ptr<std::recursive_mutex> changing_;    // null in an environment without threads; of the next
    Server* own_server_ = nullptr;      // children; InUse keeps the application from freeing them
    Session* own_session_ = nullptr;
};

// The turn on the session that a context is used with, for calls that hold no other: `link` is locked and open, or
// null, and `status` tells why.
class SessionTurn {
public:
    explicit SessionTurn(ServiceContext& service);

    Status status;
    std::shared_ptr<Link> link;

private:
    std::optional<SerialLock> lock_;    // given up before the link
};
