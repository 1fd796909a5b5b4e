#include "statements/share.h"

#include "statements/statement.h"

void StatementShare::Leave() noexcept {
    const std::lock_guard lock(mutex_);
    statement_ = nullptr;
}

// A statement that is freed leaves the set of living objects before anything else happens to it: one that is found
// there now is not destroyed while the caller's call lasts.
Statement* StatementShare::Find() const noexcept {
    const std::lock_guard lock(mutex_);
    return Live<Statement>(statement_);
}

bool StatementShare::IsLiving() const noexcept {
    const std::lock_guard lock(mutex_);
    return statement_ && live::Contains(statement_);
}

// Not as a virtual call: a destructor may have begun, and waits for the mutex in Leave.
std::shared_ptr<std::recursive_mutex> StatementShare::Serial() const {
    const std::lock_guard lock(mutex_);
    return statement_ ? statement_->Statement::Serial() : nullptr;
}
