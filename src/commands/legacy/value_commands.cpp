// Binds and defines of cursors. No address, type, length or scale is ever typed: they are those of the buffer or the
// struct member that a word names. Command thread only.
#include <algorithm>

#include "commands/families.h"
#include "commands/legacy/area_words.h"
#include "objects/buffers.h"
#include "objects/structs.h"
#include "platform/client_library.h"

namespace {

// --- A line's words as arguments -------------------------------------------------------------------------------------

struct ValueArguments {
    Cda_Def* cursor = nullptr;
    ub1 opcode = 0;
    TextArgument name;   // of a placeholder, or
    sword position = 0;  // of one, or of a column
    DataTarget target;   // opcode 0: the value is the buffer's record, which comes back as the context of pieces
    sword scale = -1;
    ub4 most_elements = 0;
    ub4* current = nullptr;
    OptionalText format;
    sword format_type = -1;

    ub1* Value() const { return static_cast<ub1*>(target.value); }
    sword Size() const { return static_cast<sword>(target.size); }
    sb4 ValueSkip() const { return static_cast<sb4>(target.value_skip); }
    sb4 FieldSkip() const { return static_cast<sb4>(target.field_skip); }
};

enum class Naming { by_name, by_position };

struct ValueCommand : CommandRow {
    bool has_opcode;
    Naming naming;
    bool is_array;  // "maxsiz cursiz" stand behind the data word
    sword (*call)(ValueArguments& value);

    // The words stand in this order; of a struct, a placeholder's name is followed by the index of a member.
    constexpr int Placeholder() const { return has_opcode ? 3 : 2; }
    constexpr int Data() const { return Placeholder() + (naming == Naming::by_name ? 2 : 1); }
    constexpr int Least() const { return Data() + 1 + (is_array ? 2 : 0); }
    constexpr bool HasFormat(int count) const { return count >= Least() + 3; }
    constexpr bool HasMember(int count) const { return (count - Least()) % 3 == 1; }
};

// False without memory, which has been said.
bool ReadPlaceholder(const ValueCommand& row, char** words, ValueArguments& value) {
    if (row.naming == Naming::by_name) return SetAreaText(value.name, words + row.Placeholder());
    value.position = DecodeNumber(words[row.Placeholder()]);
    return true;
}

// A position stands for a member of a struct, too: its number less one. False when the command ends here, which has been
// said.
bool ReadTarget(const ValueCommand& row, int count, char** words, ValueArguments& value) {
    const char* const word = words[row.Data()];
    long member = row.HasMember(count) ? DecodeLong(words[row.Data() + 1]) : 0;
    if (row.naming == Naming::by_position) member = value.position - 1L;
    if (!FindDataTarget(word, member, value.target)) return false;
    value.scale = value.target.type == SQLT_PDN ? value.target.scale : -1;
    if (!row.has_opcode || value.opcode != 0) return true;
    value.target.value = FindDynamicBuffer(word, member);
    return value.target.value != nullptr;
}

// "null" passes no current element; another word is stored in the field that is passed.
void ReadArray(char** words, ValueArguments& value) {
    value.most_elements = DecodeCount(words[0]);
    if (IsNull(words[1])) return;
    value.current = value.target.current_element;
    *value.current = DecodeCount(words[1]);
}

bool ReadFormat(char** words, ValueArguments& value) {
    value.format_type = DecodeKeywordOrNumber(words[2], SqltKeywords);
    return value.format.Set(words);
}

void RunValueCommand(const ValueCommand& row, int count, char** words) {
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    ValueArguments value;
    value.cursor = cursor.area;
    if (row.has_opcode) value.opcode = static_cast<ub1>(DecodeNumber(words[2]));
    if (!ReadPlaceholder(row, words, value) || !ReadTarget(row, count, words, value)) return;
    if (row.is_array) ReadArray(words + row.Data() + (row.HasMember(count) ? 2 : 1), value);
    if (row.HasFormat(count) && !ReadFormat(words + count - 3, value)) return;
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), row.call(value));
}

// --- The calls -------------------------------------------------------------------------------------------------------

sword BindByName(ValueArguments& v) {
    return Call(&ClientLibrary::obndrv, v.cursor, v.name.Text(), LengthOfText(v.name), v.Value(), v.Size(),
                v.target.type, v.scale, v.target.indicator, v.format.Text(), v.format.Length(), v.format_type);
}

sword BindByNumber(ValueArguments& v) {
    return Call(&ClientLibrary::obndrn, v.cursor, v.position, v.Value(), v.Size(), v.target.type, v.scale,
                v.target.indicator, v.format.Text(), v.format.Length(), v.format_type);
}

sword BindArray(ValueArguments& v) {
    return Call(&ClientLibrary::obndra, v.cursor, v.name.Text(), LengthOfText(v.name), v.Value(), v.Size(),
                v.target.type, v.scale, v.target.indicator, v.target.length, v.target.return_code, v.most_elements,
                v.current, v.format.Text(), v.format.Length(), v.format_type);
}

sword BindWithSkips(ValueArguments& v) {
    return Call(&ClientLibrary::obindps, v.cursor, v.opcode, v.name.Text(), LengthOfText(v.name), v.Value(), v.Size(),
                v.target.type, v.scale, v.target.indicator, v.target.length, v.target.return_code, v.ValueSkip(),
                v.FieldSkip(), v.FieldSkip(), v.FieldSkip(), v.most_elements, v.current, v.format.Text(),
                v.format.Length(), v.format_type);
}

sword Define(ValueArguments& v) {
    return Call(&ClientLibrary::odefin, v.cursor, v.position, v.Value(), v.Size(), v.target.type, v.scale,
                v.target.indicator, v.format.Text(), v.format.Length(), v.format_type, v.target.length,
                v.target.return_code);
}

sword DefineWithSkips(ValueArguments& v) {
    return Call(&ClientLibrary::odefinps, v.cursor, v.opcode, v.position, v.Value(), v.Size(), v.target.type, v.scale,
                v.target.indicator, v.format.Text(), v.format.Length(), v.format_type, v.target.length,
                v.target.return_code, v.ValueSkip(), v.FieldSkip(), v.FieldSkip(), v.FieldSkip());
}

constexpr ValueCommand kValueCommands[] = {
    {{Code::obndrv, Words(5, 6, 8, 9),
      "obndrv cda sqlvar sqlvar_len {memhandle | memstructhandle elementindex} [fmt fmt_len fmt_type]"},
     false, Naming::by_name, false, BindByName},
    {{Code::obndrn, Words(4, 7), "obndrn cda sqlvn {memhandle | memstructhandle} [fmt fmt_len fmt_type]"},
     false, Naming::by_position, false, BindByNumber},
    {{Code::obndra, Words(7, 8, 10, 11),
      "obndra cda sqlvar sqlvar_len {memhandle | memstructhandle elementindex} maxsiz cursiz [fmt fmt_len fmt_type]"},
     false, Naming::by_name, true, BindArray},
    {{Code::obindps, Words(8, 9, 11, 12),
      "obindps cda opcode sqlvar sqlvar_len {memhandle | memstructhandle elementindex} maxsiz cursiz "
      "[fmt fmt_len fmt_type]"},
     true, Naming::by_name, true, BindWithSkips},
    {{Code::odefin, Words(4, 7), "odefin cda pos {memhandle | memstructhandle} [fmt fmt_len fmt_type]"},
     false, Naming::by_position, false, Define},
    {{Code::odefinps, Words(5, 8), "odefinps cda opcode pos {memhandle | memstructhandle} [fmt fmt_len fmt_type]"},
     true, Naming::by_position, false, DefineWithSkips},
};

// Whether the dispatcher lets through just the counts that the columns stand for.
constexpr bool CountsMatch(const ValueCommand& row) {
    const int least = row.Least();
    const uint64_t shorter = uint64_t{1} << least | uint64_t{1} << (least + 3);
    return row.words.bits == (row.naming == Naming::by_name ? shorter | shorter << 1 : shorter);
}
static_assert(std::ranges::all_of(kValueCommands, CountsMatch));

}  // namespace

void AddLegacyValueCommands(HandlerTable& handlers) {
    handlers.Add<RunValueCommand>(kValueCommands);
}
