#include "statements/bind_rows.h"

#include <algorithm>

#include "handles/errors.h"
#include "values/in_rows.h"

namespace {

// What the pieces made: text of a terminated type ends at the zero.
int LoadCollected(BindArea& bind, std::uint32_t element, engine::Datum& value) {
    value.kind = engine::Kind::null;
    if (element >= bind.in.size() || bind.in[element].is_null) return 0;
    if (const engine::Lob* const object = bind.in[element].object.get()) {
        value.kind = engine::Kind::lob;
        value.length = 0;
        value.data = object;
        return 0;
    }
    std::string_view data = bind.in[element].bytes;
    if (bind.Type()->family != values::Family::text) return values::FromWholeBytes(data, bind.workspace, value);
    if (bind.Type()->code == SQLT_STR) data = data.substr(0, values::EndOfText(data, bind.workspace.utf16));
    return values::FromWholeText(data, bind.workspace, value);
}

}  // namespace

Status BindRows::Collect(const BoundText& text, const sql::EngineText& sql) {
    table_element = 0;
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    if (collected_ == text.Changes() && seen_ == erased) return {};
    const auto& placeholders = sql.placeholders;
    for (const std::uint32_t placeholder : placeholders)
        if (!text.IsBound(placeholder)) return Error(errors::kNotAllBound);
    seen_ = erased;
    if (collected_ == text.Changes()) return {};
    collected_ = 0;
    has_tables_ = false;
    slots_.clear();
    slots_.reserve(placeholders.size());
    for (const std::uint32_t placeholder : placeholders) {
        BindArea* bind = text.At(placeholder).get();
        bind->workspace.lobs = text.lobs;
        const sql::Placeholder& named = text.Scanned().placeholders[placeholder];
        const auto first = std::lower_bound(placeholders.begin(), placeholders.end(), named.first);
        auto same_as = static_cast<std::size_t>(first - placeholders.begin());
        if (same_as >= slots_.size() || slots_[same_as].bind != bind) same_as = slots_.size();
        slots_.push_back({bind, same_as, named.is_row_id});
        has_tables_ |= bind->IsTable();
    }
    collected_ = text.Changes();
    return {};
}

std::vector<engine::Kind> KindsOf(const BoundText& text, const sql::EngineText& sql) {
    std::vector<engine::Kind> kinds;
    for (const std::uint32_t placeholder : sql.placeholders) {
        engine::Kind kind = engine::Kind::null;
        if (text.IsBound(placeholder)) {
            const BindArea& bind = *text.At(placeholder);
            kind = values::KindOf(*bind.Type(), bind.elements.size);
        }
        const bool as_row_id = kind == engine::Kind::text && text.Scanned().placeholders[placeholder].is_row_id;
        kinds.push_back(as_row_id ? engine::Kind::row_id : kind);
    }
    return kinds;
}

std::vector<std::string_view> PlaceholdersOf(const BoundText& text, const sql::EngineText& sql) {
    std::vector<std::string_view> written;
    written.reserve(sql.placeholders.size());
    for (const std::uint32_t index : sql.placeholders) {
        const sql::Placeholder& placeholder = text.Scanned().placeholders[index];
        written.push_back(std::string_view(text.Text()).substr(placeholder.begin, placeholder.end - placeholder.begin));
    }
    return written;
}

Status BindRows::Row(std::uint32_t row, std::span<engine::Datum> values) {
    for (std::size_t index = 0; index < slots_.size(); ++index) {
        const Slot& slot = slots_[index];
        const bool again = slot.same_as != index && slots_[slot.same_as].is_row_id == slot.is_row_id;
        if (again) {
            values[index] = values[slot.same_as];
        } else if (const int error = Load(slot, row, values[index])) {
            return Error(error);
        }
    }
    return {};
}

int BindRows::Load(const Slot& slot, std::uint32_t row, engine::Datum& value) const {
    BindArea& bind = *slot.bind;
    const std::uint32_t element = bind.IsTable() ? table_element : row;
    const int error = bind.InPieces()
                          ? LoadCollected(bind, bind.IsTable() ? table_element : 0, value)
                          : values::Load(bind.elements, element, bind.Type()->in, bind.workspace, value);
    if (error != 0 || !slot.is_row_id || value.kind != engine::Kind::text) return error;
    return values::RowIdFromText(bind.workspace, value);
}

Status BindRows::TableElements(std::uint32_t& count) const {
    bool first = true;
    for (const Slot& slot : slots_) {
        if (!slot.bind->IsTable()) continue;
        const ub4 elements = *slot.bind->current_elements;
        if (elements > slot.bind->most_elements) return Error(errors::kBadTableLength);
        if (!first && elements != count) return Error(errors::kTablesDiffer);
        count = elements;
        first = false;
    }
    return {};
}
