// What a statement shares with the handles that belong to it (binds, defines, parameters), which may outlive it: where
// the statement is and what its calls hold, and the names that it has shown. The last holder frees it.
//
// Threads: Find and Serial from any thread at any time, within a call; KeepName under the statement's serial lock.
#pragma once

#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <string_view>

class Statement;

class StatementShare {
public:
    explicit StatementShare(Statement& statement) : statement_(&statement) {}

    // The statement goes: first thing in its destructor.
    void Leave() noexcept;
    // The living statement, which lives on until the calling thread's call ends; null when it is freed.
    [[nodiscard]] Statement* Find() const noexcept;
    // Whether it is not freed; one that rests in a statement cache is found by nobody and lives.
    [[nodiscard]] bool IsLiving() const noexcept;
    // What calls on the statement hold; null when it is gone, or where nothing has to be held.
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() const;

    // A copy of a name (as the application reads it) that stays where it is as long as the statement lives.
    std::string_view KeepName(std::string_view name);

private:
    mutable std::mutex mutex_;    // between Leave and the others
    Statement* statement_;
    std::set<std::string, std::less<>> names_;
};
