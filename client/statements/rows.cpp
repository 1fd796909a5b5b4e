#include "statements/rows.h"

#include <algorithm>

#include "handles/errors.h"
#include "values/in_rows.h"
#include "values/rowid.h"

namespace {

// What the pieces made: text of a terminated type ends at the zero.
int LoadCollected(Bind& bind, engine::Datum& value) {
    value.kind = engine::Kind::null;
    if (bind.collected_null) return 0;
    std::string_view data = bind.collected;
    if (bind.Type()->family != values::Family::text) return values::FromWholeBytes(data, bind.workspace, value);
    if (bind.Type()->code == SQLT_STR && !bind.workspace.utf16) data = data.substr(0, data.find('\0'));
    return values::FromWholeText(data, bind.workspace, value);
}

}  // namespace

Status Statement::Rows::Collect(const Statement& statement, const Compiled& compiled) {
    const std::vector<std::uint32_t>& placeholders = compiled.text.placeholders;
    slots_.clear();
    slots_.reserve(placeholders.size());
    for (const std::uint32_t placeholder : placeholders) {
        Bind* bind = statement.bound_[placeholder];
        if (!bind) return Error(errors::kNotAllBound);
        const sql::Placeholder& named = statement.scanned_.placeholders[placeholder];
        const auto first = std::lower_bound(placeholders.begin(), placeholders.end(), named.first);
        auto same_as = static_cast<std::size_t>(first - placeholders.begin());
        if (same_as >= slots_.size() || slots_[same_as].bind != bind) same_as = slots_.size();
        slots_.push_back({bind, same_as, named.is_row_id});
    }
    return {};
}

Status Statement::Rows::Row(std::uint32_t row, std::span<engine::Datum> values) {
    for (std::size_t index = 0; index < slots_.size(); ++index) {
        const Slot& slot = slots_[index];
        const bool again = slot.same_as != index && slots_[slot.same_as].is_row_id == slot.is_row_id;
        if (again) values[index] = values[slot.same_as];
        else if (const int error = Load(slot, row, values[index])) return Error(error);
    }
    return {};
}

int Statement::Rows::Load(const Slot& slot, std::uint32_t row, engine::Datum& value) const {
    Bind& bind = *slot.bind;
    const std::uint32_t element = bind.IsTable() ? table_element : row;
    const int error = bind.InPieces()
                          ? LoadCollected(bind, value)
                          : values::Load(bind.elements, element, bind.Type()->in, bind.workspace, value);
    if (error != 0 || !slot.is_row_id || value.kind != engine::Kind::text) return error;
    return values::RowIdFromText(value);
}

bool Statement::Rows::HasTables() const {
    return std::any_of(slots_.begin(), slots_.end(), [](const Slot& slot) { return slot.bind->IsTable(); });
}

Status Statement::Rows::TableElements(std::uint32_t& count) const {
    bool first = true;
    for (const Slot& slot : slots_) {
        if (!slot.bind->IsTable()) continue;
        if (!first && *slot.bind->current_elements != count) return Error(errors::kTablesDiffer);
        count = *slot.bind->current_elements;
        first = false;
    }
    return {};
}
