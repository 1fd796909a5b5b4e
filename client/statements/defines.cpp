#include "statements/defines.h"

#include <algorithm>
#include <utility>

#include "handles/errors.h"

std::shared_ptr<DataArea> Defines::At(ub4 position) const {
    return position <= made_.size() ? made_[position - 1] : nullptr;
}

void Defines::Put(ub4 position, const std::shared_ptr<DataArea>& area, const Object& statement) noexcept {
    changed_ = true;
    const std::shared_ptr<DataArea> before = std::exchange(made_[position - 1], area);
    if (before && before != area) ReleaseArea(*before, statement);
}

void Defines::Retire(const Object& statement) noexcept {
    changed_ = true;
    active_.clear();
    for (const auto& area : std::exchange(retired_, std::exchange(made_, {})))
        if (area && !area->Owner()) ReleaseArea(*area, statement);
    for (const auto& area : retired_)
        if (area) area->SetOwner(nullptr);
}

bool Defines::AllLive() const {
    return std::all_of(active_.begin(), active_.end(), [](const Active& active) { return active.area->HasHandle(); });
}

Status Defines::Activate(const std::vector<engine::Column>& columns, const std::shared_ptr<values::LobSession>& lobs) {
    const std::uint64_t erased = live::erased_objects.load(std::memory_order_acquire);
    if (!changed_ && (erased == seen_ || AllLive())) {
        seen_ = erased;
        return {};
    }
    changed_ = true;
    active_.clear();
    in_pieces_ = at_once_ = false;
    for (std::uint32_t index = 0; index < made_.size(); ++index) {
        const std::shared_ptr<DataArea>& area = made_[index];
        if (!area || !area->HasHandle()) continue;
        if (index >= columns.size()) return Error(errors::kNoSuchColumn);
        area->workspace.column = values::ClassOf(columns[index].type);
        area->workspace.lobs = lobs;
        Active& active = active_.emplace_back(Active{area, index, {}, {}});
        active.converters = values::ForColumn(*area->Type()->out, area->workspace.column);
        if (area->InPieces()) active.renderers = values::ForColumn(*area->Type()->pieces, area->workspace.column);
        (area->InPieces() ? in_pieces_ : at_once_) = true;
    }
    if (active_.empty()) return Error(errors::kNoDefines);
    changed_ = false;
    seen_ = erased;
    return {};
}

int Defines::StoreRow(std::size_t index, std::span<const engine::Datum> row) const {
    int worst = 0;
    if (!at_once_) return worst;
    for (const Active& active : active_) {
        DataArea& area = *active.area;
        if (area.InPieces()) continue;
        const int error = values::Store(area.elements, index, active.converters, area.workspace, row[active.column]);
        if (error != 0 && (worst == 0 || worst == errors::kTruncationWarning)) worst = error;
    }
    return worst;
}
