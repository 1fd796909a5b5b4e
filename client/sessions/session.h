// User sessions: who is logged on, and the link that the session's work runs on. Session handles also carry the names
// and passwords for pools (they are authentication handles).
//
// Threads: a session that is begun is used under the serial lock of its link, which Begin, End and Drop take
// themselves; of several threads that begin one session, one does. No thread holds the locks of two links that it waits
// for.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>

#include "engine/engine.h"
#include "handles/environment.h"
#include "handles/kept.h"
#include "sessions/link.h"

class Server;

class Session : public Object {
public:
    static constexpr Kind kKind = Kind::session;
    explicit Session(const Origin& origin, bool own = false) : Object(origin), own_(own) {}
    ~Session() override;
    [[nodiscard]] std::span<const AttributeRow> Attributes() const override;
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() override;
    [[nodiscard]] bool InUse() const override { return own_; }

    [[nodiscard]] bool Begun() const { return GetLink() != nullptr; }
    [[nodiscard]] const std::shared_ptr<Link>& GetLink() const { return link_.Get(); }    // null until begun
    [[nodiscard]] std::shared_ptr<Link> ShareLink() const { return link_.Share(); }    // without the serial lock

    Status Begin(Server& server, const engine::Credentials& credentials);
    // Commits; an error leaves the session as it was, but for a broken one that is to be `released`.
    Status End(GivingBack* released = nullptr);
    // Begins with what another session has begun, which has ended then: link, transaction and all.
    Status TakeOver(Session& from, Server& server);
    // On the session's own connection: error 1012 when it is not begun.
    Status ChangePassword(const std::string& user_name, const std::string& old_password,
                          const std::string& new_password);
    void Drop() noexcept;     // rolls back; nothing when not begun
    // Objects named without a schema are looked for there: at once, or when the session begins. 1435: it cannot be.
    Status UseSchema(std::string schema);
    Status GetSchema(std::string& schema) const;    // that the application wants, else the engine's

    const Birth birth;
    std::string user;
    std::string password;
    std::string client_identifier;
    std::string module;
    std::string action;
    std::string client_info;
    std::string driver_name;
    std::string connection_class;
    std::string current_schema;
    std::string edition;
    std::uint32_t purity = 0;

private:
    Status Connect(Server& server, const engine::Credentials& credentials);
    void Leave() noexcept;    // the link is closed
    class Turn;

    const bool own_;
    std::atomic<bool> beginning_{false};    // some thread is at it
    LinkShare link_;
    Server* server_ = nullptr;    // while begun
};
