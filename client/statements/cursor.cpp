#include "statements/cursor.h"

void Cursor::Open(engine::Query& query, bool scrollable) {
    Close();
    query_ = &query;
    scrollable_ = scrollable;
    current_.assign(query.Columns().size(), engine::Datum{});
}

void Cursor::Open(std::unique_ptr<engine::Query> query) {
    Open(*query, false);
    owned_ = std::move(query);
}

void Cursor::Close() noexcept {
    if (query_) query_->Close();
    owned_.reset();
    query_ = nullptr;
    at_end_ = false;
    position_ = reached_ = 0;
    row_ = {};
    kept_.Clear();
}

// Steps the query itself.
Status Cursor::Read(bool& found) {
    found = false;
    if (at_end_) return {};
    Status status = query_->Fetch(current_, found);
    if (!status.Ok()) return status;
    at_end_ = !found;
    if (!found) return {};
    ++reached_;
    if (scrollable_) kept_.Append(current_);
    return {};
}

Status Cursor::Next(bool& found) {
    if (scrollable_) return GoTo(position_ + 1, found);
    Status status = Read(found);
    if (found) {
        row_ = current_;
        position_ = reached_;
    }
    return status;
}

Status Cursor::GoTo(std::uint64_t position, bool& found) {
    found = position > 0;
    while (found && reached_ < position) {
        if (Status status = Read(found); !status.Ok()) return status;
    }
    position_ = found ? position : position == 0 ? 0 : reached_ + 1;
    if (found) row_ = kept_.Row(position - 1);
    return {};
}

Status Cursor::Count(std::uint64_t& rows) {
    bool found = true;
    while (found) {
        if (Status status = Read(found); !status.Ok()) return status;
    }
    rows = reached_;
    return {};
}
