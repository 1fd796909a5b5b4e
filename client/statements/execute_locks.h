// What an execute holds while it runs: the locks of the session that it runs on, of the statement's own link, which it
// may leave, and, of a block, those of the statements that it gives results to. None is held while another is waited
// for, so that no order of them matters.
#pragma once

#include <memory>
#include <mutex>
#include <vector>

#include "statements/statement.h"

class ExecuteLocks {
public:
    ExecuteLocks(ServiceContext& service, Statement& statement, const ExecuteArguments& arguments);
    ~ExecuteLocks() { Unlock(); }
    ExecuteLocks(const ExecuteLocks&) = delete;
    ExecuteLocks& operator=(const ExecuteLocks&) = delete;

    // What the execute runs on, as it was found with its lock held.
    [[nodiscard]] const ExecuteTarget& Target() const { return target_; }

private:
    using Mutex = std::shared_ptr<std::recursive_mutex>;
    bool Hold(ServiceContext& service, Statement& statement, const ExecuteArguments& arguments);
    [[nodiscard]] std::vector<Mutex> LocksOfTargets(const Statement& statement, const ExecuteArguments& arguments) const;
    void Lock();
    void LockAll();
    void Unlock() noexcept;

    // The first two, nearly always one and the same, take no memory.
    Mutex service_, statement_;
    std::vector<Mutex> targets_;
    bool held_ = false;
    ExecuteTarget target_;
};
