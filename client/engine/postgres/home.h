// A PostgreSQL server as its URL names it, shared by the database and its connections: how to connect, and what is known
// of the server once somebody has.
#pragma once

#include <atomic>
#include <memory>
#include <mutex>
#include <string>

#include "engine/postgres/wire.h"

namespace engine::postgres {

class Home {
public:
    explicit Home(std::string url) : url_(std::move(url)) {}

    // Whether somebody answers there; a connection that could be made without a password is kept for the first who wants
    // such a one.
    Status Attach();
    // A connection of a user's, ready for statements.
    Status Connect(const Credentials& credentials, std::shared_ptr<const StopRequest> stop,
                   std::unique_ptr<Wire>& wire);
    [[nodiscard]] std::string Version();
    [[nodiscard]] std::string Where();    // host, port and database; the URL as long as nobody has connected
    [[nodiscard]] bool TwoPhase() const { return two_phase_.load(std::memory_order_relaxed); }

private:
    Status Log(const Credentials& credentials, std::shared_ptr<const StopRequest> stop, std::unique_ptr<Wire>& wire);
    Status Prime(Wire& wire);
    static void MakeSchema(Wire& wire);

    const std::string url_;
    std::mutex mutex_;    // of what is below
    std::unique_ptr<Wire> spare_;
    std::string version_;
    std::string where_;
    std::atomic<bool> two_phase_{false};
};

// A user's name as the server has it: letter case counts in quotes only.
std::string RoleName(std::string_view name);

}  // namespace engine::postgres
