// The statement cache of a session: statements that were released, with all that was compiled and bound, until the same
// text or key is prepared again. A kept statement is no living handle for the application.
#pragma once

#include <cstdint>
#include <memory>
#include <string_view>
#include <vector>

#include "sessions/link.h"

class Environment;
class ServiceContext;
class Statement;

class StatementCache : public LinkData {
public:
    ~StatementCache() override;

    void SetCapacity(std::uint32_t capacity);
    [[nodiscard]] std::uint32_t Capacity() const { return capacity_; }

    // Takes out the statement kept under a key, or an untagged one of this text; null when there is none.
    Statement* TakeByKey(std::string_view key);
    Statement* TakeByText(std::string_view text);
    // Keeps a statement under its key, or under its text when the key is empty; one kept so before goes, and the oldest
    // when there are too many. Throws std::bad_alloc.
    void Keep(Statement& statement, std::string_view key);
    void Forget(const Statement& statement) noexcept;

private:
    template <class Match>
    Statement* Take(Match match);
    void Drop(std::size_t index) noexcept;

    std::uint32_t capacity_ = 0;
    std::vector<Statement*> kept_;    // the oldest first
};

// What OCIStmtPrepare2 was asked for. Texts are UTF-8; an empty one was not given.
struct PrepareRequest {
    std::string_view text;
    std::string_view key;
    bool search_only;
};

// Finds the statement in the cache or makes a new one.
Status PrepareThroughCache(ServiceContext& service, const PrepareRequest& request, Statement*& statement);
// Gives a statement of PrepareThroughCache back: to the cache, if there is one and `keep`.
Status Release(Statement& statement, std::string_view key, bool keep);
