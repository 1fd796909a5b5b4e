// What a statement shares with the handles that belong to it (binds, defines, parameters), which may outlive it: where
// the statement is and what its calls hold, and the names that it has shown (KeepText). The last holder frees it.
//
// Threads: Find and Serial from any thread at any time, within a call.
#pragma once

#include <memory>
#include <mutex>

#include "describe/parameter.h"

class Statement;

class StatementShare : public ParameterSource {
public:
    explicit StatementShare(Statement& statement) : statement_(&statement) {}

    // The statement goes: first thing in its destructor.
    void Leave() noexcept;
    // The living statement, which lives on until the calling thread's call ends; null when it is freed.
    [[nodiscard]] Statement* Find() const noexcept;
    // Whether it is not freed; one that rests in a statement cache is found by nobody and lives.
    [[nodiscard]] bool IsLiving() const noexcept;
    // What calls on the statement hold; null when it is gone, or where nothing has to be held.
    [[nodiscard]] std::shared_ptr<std::recursive_mutex> Serial() const override;

private:
    mutable std::mutex mutex_;    // between Leave and the others
    Statement* statement_;
};
