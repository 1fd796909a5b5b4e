// Putting the edits of a statement into its text.
#include "engine/sqlite/value_targets.h"

#include <algorithm>

#include "engine/sqlite/assignments.h"
#include "engine/sqlite/comparisons.h"
#include "engine/sqlite/pieces.h"

namespace engine::sqlite {
namespace {

// Where an edit begins or ends.
struct Mark {
    std::size_t at, other;    // its offset, and that of the edit's other end
    bool ends;
    const ValueTargets::Edit* edit;
};

// At one place ends come before beginnings, inner ends before outer ones, outer beginnings before inner ones.
bool ComesBefore(const Mark& left, const Mark& right) {
    if (left.at != right.at) return left.at < right.at;
    if (left.ends != right.ends) return left.ends;
    return left.other > right.other;
}

}  // namespace

std::string ValueTargets::Rewritten(std::string_view text) const {
    std::string rewritten;
    if (edits.empty()) return rewritten;
    std::vector<Mark> marks;
    for (const Edit& edit : edits) {
        marks.push_back({edit.begin, edit.end, false, &edit});
        marks.push_back({edit.end, edit.begin, true, &edit});
    }
    std::stable_sort(marks.begin(), marks.end(), ComesBefore);
    std::size_t copied = 0;
    for (const Mark& mark : marks) {
        const bool skips = mark.ends && mark.edit->replaces;
        if (!skips) rewritten.append(text.substr(copied, mark.at - copied));
        rewritten.append(mark.ends ? mark.edit->after : mark.edit->before);
        copied = mark.at;
    }
    return rewritten.append(text.substr(copied));
}

Status FindValueTargets(sqlite3* database, std::string_view sql, ValueTargets& targets) {
    const std::vector<std::string_view> pieces = Split(sql);
    FindAssignments(database, sql, pieces, targets);
    return FindComparisons(database, sql, pieces, targets);
}

}  // namespace engine::sqlite
