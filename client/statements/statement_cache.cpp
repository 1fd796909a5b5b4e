#include "statements/statement_cache.h"

#include <algorithm>

#include "handles/environment.h"
#include "handles/errors.h"
#include "sessions/service_context.h"
#include "statements/statement.h"

namespace {

// The cache of a session, as large as the service context asks; null when it asks for none.
StatementCache* CacheOf(ServiceContext& service, Link& link) {
    if (!link.statement_cache) {
        if (service.statement_cache_size == 0) return nullptr;
        link.statement_cache = std::make_unique<StatementCache>();
    }
    auto* cache = static_cast<StatementCache*>(link.statement_cache.get());
    cache->SetCapacity(service.statement_cache_size);
    return service.statement_cache_size > 0 ? cache : nullptr;
}

}  // namespace

StatementCache::~StatementCache() { while (!kept_.empty()) Drop(kept_.size() - 1); }

void StatementCache::Drop(std::size_t index) noexcept {
    Statement* statement = kept_[index];
    kept_.erase(kept_.begin() + static_cast<std::ptrdiff_t>(index));
    statement->kept_in = nullptr;
    statement->LinkClosed();    // the connection may go before the statement does
    Destroy(statement);
}

void StatementCache::SetCapacity(std::uint32_t capacity) {
    capacity_ = capacity;
    while (kept_.size() > capacity_) Drop(0);
}

template <class Match>
Statement* StatementCache::Take(Match match) {
    const auto found = std::find_if(kept_.begin(), kept_.end(), match);
    if (found == kept_.end()) return nullptr;
    Statement* statement = *found;
    kept_.erase(found);
    statement->kept_in = nullptr;
    live::Retype(statement, Kind::statement);
    return statement;
}

Statement* StatementCache::TakeByKey(std::string_view key) {
    return Take([key](const Statement* statement) { return statement->cache_key == key; });
}

Statement* StatementCache::TakeByText(std::string_view text) {
    return Take([text](const Statement* kept) { return kept->cache_key.empty() && kept->Text() == text; });
}

void StatementCache::Keep(Statement& statement, std::string_view key) {
    statement.cache_key = key;
    kept_.reserve(kept_.size() + 1);
    if (Statement* before = key.empty() ? TakeByText(statement.Text()) : TakeByKey(key)) Destroy(before);
    statement.Rest();
    live::Retype(&statement, Kind::none);
    statement.kept_in = this;
    kept_.push_back(&statement);
    if (kept_.size() > capacity_) Drop(0);
}

void StatementCache::Forget(const Statement& statement) noexcept { std::erase(kept_, &statement); }

Status PrepareThroughCache(ServiceContext& service, const PrepareRequest& request, Statement*& statement) {
    if (request.text.empty() && request.key.empty()) return Error(errors::kNoTextOrKey);
    const SessionTurn turn(service);
    if (!turn.status.Ok()) return turn.status;
    const std::shared_ptr<Link>& link = turn.link;
    StatementCache* cache = CacheOf(service, *link);
    statement = cache && !request.key.empty() ? cache->TakeByKey(request.key) : nullptr;
    const bool by_key = statement;
    if (!by_key && cache && !request.text.empty()) statement = cache->TakeByText(request.text);
    if (statement) {
        statement->Join(link);
        return by_key || request.key.empty() ? Status() : Warning(errors::kUntagged);
    }
    if (request.search_only || request.text.empty()) return Error(errors::kNotInCache);
    Statement* made = Create<Statement>(service.Env(), OCI_HTYPE_STMT, 0);
    try {
        Status status = made->Prepare(request.text);
        made->Join(link);
        made->from_prepare2 = true;
        statement = made;
        return status;
    } catch (...) {
        Destroy(made);
        throw;
    }
}

Status Release(Statement& statement, std::string_view key, bool keep) {
    if (!statement.from_prepare2) return Error(errors::kNotFromPrepare2);
    StatementCache* cache = statement.Cache();
    if (keep && cache) cache->Keep(statement, key);
    else Destroy(&statement);
    return {};
}
