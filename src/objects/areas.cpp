// The tables of login and cursor data areas.
#include "objects/areas.h"

#include <cstring>
#include <utility>

#include "core/keywords.h"
#include "core/messages.h"

namespace {

NamedArea logins[30];
NamedArea cursors[30];

}  // namespace

std::span<NamedArea> Areas(Kind kind) {
    return kind == Kind::cursor ? cursors : logins;
}

Cda_Def* InvalidArea() {
    alignas(Cda_Def) static unsigned char area[512];
    std::memset(area, 0, sizeof area);
    std::strcpy(reinterpret_cast<char*>(area), "Invalid buffer");
    return reinterpret_cast<Cda_Def*>(area);
}

AreaArgument ResolveArea(Kind kind, const char* word) {
    if (IsInvalid(word)) return {.area = InvalidArea()};
    NamedArea* const slot = FindSlot(Areas(kind), word);
    if (slot != nullptr) return {slot->area, slot};
    if (!IsNull(word)) Message(kError, "Handle %s not found\n", word);
    return {};
}

void ReleaseArea(NamedArea& slot) {
    for (NamedArea& cursor : cursors)
        if (cursor.parent == slot.area) cursor.parent = nullptr;
    FreeMem(std::exchange(slot.area, nullptr));
    FreeMem(std::exchange(slot.host_area, nullptr));
    slot.in_use = false;
}

bool NewArea::Make() {
    if (OutputName(name_) == nullptr) return true;
    held_ = FindSlot(Areas(kind_), name_);
    if (held_ == nullptr) {
        area_.reset(static_cast<Cda_Def*>(GetMem(sizeof(Cda_Def))));
        return area_ != nullptr;
    }
    if (InfoOf(kind_).in_use == nullptr) return true;
    MessageText(kError, InfoOf(kind_).in_use);
    return false;
}

ub1* NewArea::MakeHost() {
    host_area_.reset(static_cast<ub1*>(GetMem(kHostSize)));
    return host_area_.get();
}

void NewArea::Enter(Lda_Def* parent) {
    if (held_ != nullptr) held_->parent = parent;
    if (area_ == nullptr) return;
    Cda_Def* const area = area_.release();
    ub1* const host_area = host_area_.release();
    if (!MayBeName(name_)) return;
    NamedArea* const slot = OccupySlot(kind_, Areas(kind_), name_);
    if (slot == nullptr) return;
    slot->parent = parent;
    slot->area = area;
    slot->host_area = host_area;
}
