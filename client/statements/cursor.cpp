#include "statements/cursor.h"

#include <algorithm>
#include <utility>

#include "handles/in_flight.h"

namespace {

// Rows that nobody wants.
class Nowhere final : public CountedSink {
public:
    Status Row(std::uint32_t, std::span<const engine::Datum>) override {
        ++rows;
        return {};
    }
};

}  // namespace

void Cursor::Open(engine::Query& query, bool scrollable) noexcept {
    Close();
    query_ = &query;
    scrollable_ = scrollable;
}

void Cursor::Open(std::unique_ptr<engine::Query> query) noexcept {
    Close();
    owned_ = std::move(query);
    query_ = owned_.get();
}

void Cursor::Close() noexcept {
    if (query_) query_->Close();
    query_ = nullptr;
    owned_.reset();
    scrollable_ = at_end_ = false;
    position_ = reached_ = 0;
}

Status Cursor::Read(CountedSink& sink, std::uint32_t most, std::uint32_t& delivered) {
    delivered = 0;
    if (scrollable_) return ReadFrom(position_ + 1, sink, most, delivered);
    if (at_end_ || most == 0) return {};
    const LongCall may_take_long;
    bool more = true;
    const std::uint32_t before = sink.rows;
    Status status = query_->Fetch(sink, most, more);
    delivered = sink.rows - before;
    reached_ = position_ += delivered;
    if (status.Ok()) at_end_ = !more;
    return status;
}

Status Cursor::ReadFrom(std::uint64_t position, CountedSink& sink, std::uint32_t most, std::uint32_t& delivered) {
    const LongCall may_take_long;
    const std::uint32_t before = sink.rows;
    bool found = false;
    delivered = 0;
    Status status = query_->Scroll(position, sink, found);
    if (status.Ok() && !found) {
        position_ = 0;
        if (position == 0) return {};
        status = Count(reached_);
        position_ = reached_ + 1;
        return status;
    }
    bool more = true;
    if (status.Ok() && most > 1) status = query_->Fetch(sink, most - 1, more);
    delivered = sink.rows - before;
    if (delivered == 0) return status;
    position_ = position + delivered - 1;
    reached_ = std::max(reached_, position_);
    return status;
}

Status Cursor::AnyMore(bool& more) {
    Nowhere nowhere;
    std::uint32_t delivered = 0;
    Status status = Read(nowhere, 1, delivered);
    more = delivered > 0;
    return status;
}

Status Cursor::Count(std::uint64_t& rows) {
    const LongCall may_take_long;
    return query_->Count(rows);
}
