// Putting the edits of a statement into its text.
#include "engine/sqlite/value_targets.h"

#include <algorithm>
#include <array>
#include <charconv>

#include "engine/pieces.h"
#include "engine/sqlite/assignments.h"
#include "engine/sqlite/comparisons.h"
#include "engine/sqlite/date_uses.h"
#include "engine/sqlite/interval_uses.h"
#include "engine/sqlite/names.h"
#include "engine/sqlite/number_uses.h"
#include "engine/sqlite/stored_number.h"
#include "engine/sqlite/table_columns.h"
#include "number/number.h"

namespace engine::sqlite {
namespace {

std::string BlobLiteral(const void* data, std::size_t size) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    std::string literal = "x'";
    for (const char c : std::string_view(static_cast<const char*>(data), size)) {
        literal += kDigits[static_cast<unsigned char>(c) >> 4];
        literal += kDigits[static_cast<unsigned char>(c) & 15];
    }
    return literal += '\'';
}

Status NumberLiteral(const OCINumber& number, std::string& literal) {
    const StoredNumber stored = StoredNumber::From(number);
    if (stored.form == StoredNumber::Form::blob) {
        literal = BlobLiteral(stored.blob, stored.length);
        return {};
    }
    std::array<char, number::kMaxPlainText> text;
    std::size_t length = 0;
    const int failure = number::ToPlainText(number, '.', text.data(), &length);
    literal.assign(text.data(), length);
    return failure == 0 ? Status() : Error(failure);
}

// Where an edit begins or ends.
struct Mark {
    std::size_t at, other;    // its offset, and that of the edit's other end
    bool ends;
    const ValueTargets::Edit* edit;
};

// At one place are ends, inner ones before outer ones, or beginnings, outer ones first. Of two edits of the same text the
// later one is the inner.
bool ComesBefore(const Mark& left, const Mark& right) {
    if (left.at != right.at) return left.at < right.at;
    if (left.other != right.other) return left.other > right.other;
    return left.ends ? left.edit > right.edit : left.edit < right.edit;
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
    const auto append = [&](std::string_view part) {    // which may have stood in quotes beside a word
        const bool joins = !rewritten.empty() && !part.empty() && IsWordCharacter(rewritten.back()) && IsWordCharacter(part.front());
        rewritten.append(joins ? " " : "").append(part);
    };
    std::size_t copied = 0;
    for (const Mark& mark : marks) {
        const bool skips = mark.ends && mark.edit->replaces;
        if (!skips) append(text.substr(copied, mark.at - copied));
        append(mark.ends ? mark.edit->after : mark.edit->before);
        copied = mark.at;
    }
    append(text.substr(copied));
    return rewritten;
}

Status Convert(std::string_view text, const Column& column, Coercion::Purpose purpose, std::string& literal) {
    Datum value;
    value.kind = Kind::text;
    value.data = text.data();
    value.length = static_cast<std::uint32_t>(text.size());
    Coercion coercion(column, purpose);
    if (Status status = coercion.Apply(value); status.Failed()) return status;
    switch (value.kind) {
        case Kind::null: literal = "null"; break;
        case Kind::integer: literal = std::to_string(value.integer); break;
        case Kind::decimal: return NumberLiteral(*static_cast<const OCINumber*>(value.data), literal);
        case Kind::bytes: literal = BlobLiteral(value.data, value.length); break;
        case Kind::real: {
            std::array<char, 40> digits;
            const char* end = std::to_chars(digits.data(), digits.data() + digits.size(), value.real).ptr;
            literal.assign(digits.data(), static_cast<std::size_t>(end - digits.data()));
            break;
        }
        default: literal = Literal(value.Text()); break;
    }
    return {};
}

Status FindValueTargets(sqlite3* database, std::string_view sql, bool has_intervals, ValueTargets& targets) {
    const std::vector<std::string_view> pieces = Split(sql);
    StatementReading reading(database, sql, pieces);
    Status status = FindAssignments(database, reading, targets);
    if (status.Ok()) status = FindComparisons(reading, targets);
    if (status.Ok()) status = FindDateUses(reading);
    if (status.Ok()) FindNumberUses(reading, targets);
    const bool uses = has_intervals || sql.find(kSpanPrefix) != sql.npos;
    return status.Ok() && uses ? FindIntervalUses(reading, targets) : status;
}

}  // namespace engine::sqlite
