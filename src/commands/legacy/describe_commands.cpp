// What a query's columns and a procedure's arguments are. Command thread only.
#include <algorithm>
#include <iterator>
#include <vector>

#include "commands/families.h"
#include "commands/legacy/area_words.h"
#include "core/messages.h"
#include "platform/client_library.h"

namespace {

// --- Columns ---------------------------------------------------------------------------------------------------------

template <class T> void PrintOutput(const char* name, const T* place) {
    if (place != nullptr) Message(kOutput, "%s=%ld\n", name, static_cast<long>(*place));
}

// Room for what the library may write when told the length, within reason.
size_t RoomForName(sb4 length) {
    constexpr sb4 kLeast = 1024;
    constexpr sb4 kMost = 1 << 20;
    return static_cast<size_t>(std::clamp(length, kLeast, kMost));
}

void DescribeColumn(const CommandRow& row, int count, char** words) {
    constexpr sb4 kOwnLength = 240;
    const AreaArgument cursor = ResolveArea(Kind::cursor, words[1]);
    sb4 size = 0, display_size = 0, length = count > 6 ? DecodeNumber(words[6]) : kOwnLength;
    sb2 type = 0, precision = 0, scale = 0, nulls = 0;
    std::vector<sb1> room(RoomForName(length));
    sb4* const size_place = Place(size, count, words, 3);
    sb2* const type_place = Place(type, count, words, 4);
    sb1* const name_place = Place(room[0], count, words, 5);
    sb4* const length_place = Place(length, count, words, 6);
    sb4* const display_place = Place(display_size, count, words, 7);
    sb2* const precision_place = Place(precision, count, words, 8);
    sb2* const scale_place = Place(scale, count, words, 9);
    sb2* const nulls_place = Place(nulls, count, words, 10);
    const sword rc = Call(&ClientLibrary::odescr, cursor.area, DecodeNumber(words[2]), size_place, type_place,
                          name_place, length_place, display_place, precision_place, scale_place, nulls_place);
    TraceAndReportAreas(row.code, words[1], CalledCursor(cursor), rc);
    if (rc != OCI_SUCCESS) return;
    PrintOutput("dbsize", size_place);
    PrintOutput("dbtype", type_place);
    if (name_place != nullptr && length_place != nullptr) {
        const int shown = std::clamp<int>(length, 0, static_cast<int>(room.size()));
        Message(kOutput, "cbuf=%.*s\n", shown, reinterpret_cast<const char*>(room.data()));
    }
    PrintOutput("cbufl", length_place);
    PrintOutput("dsize", display_place);
    PrintOutput("prec", precision_place);
    PrintOutput("scale", scale_place);
    PrintOutput("nullok", nulls_place);
}

// --- Arguments of procedures -----------------------------------------------------------------------------------------

constexpr ub4 kMostArguments = 100;
constexpr size_t kNameRoom = 256;
constexpr int kFirstArray = 5;  // the word that may refuse the first of the arrays

// The arrays that a description fills, in the order of the words that may refuse them.
struct Arrays {
    ub2 overload[kMostArguments], position[kMostArguments], level[kMostArguments];
    text* name[kMostArguments];
    ub2 name_length[kMostArguments], type[kMostArguments];
    ub1 has_default[kMostArguments], mode[kMostArguments];
    ub4 size[kMostArguments];
    sb2 precision[kMostArguments], scale[kMostArguments];
    ub1 radix[kMostArguments];
    ub4 spare[kMostArguments];
    char names[kMostArguments][kNameRoom];
};

// Names are read where they were asked for, whatever the library has made of the pointers.
void PrintArgument(const Arrays& arrays, ub4 index, int count, char** words) {
    Line line;
    line.Format("%ld", static_cast<long>(index));
    int word = kFirstArray;
    const auto wanted = [&] {
        const int at = word++;
        return at >= count || !IsNull(words[at]);
    };
    const auto number = [&](const char* name, const auto& array) {
        if (wanted()) line.Format(" %s=%ld", name, static_cast<long>(array[index]));
    };
    number("ovrld", arrays.overload);
    number("pos", arrays.position);
    number("level", arrays.level);
    if (wanted()) line.Format(" argnm=%.*s", static_cast<int>(kNameRoom), arrays.names[index]);
    number("arnlen", arrays.name_length);
    number("dtype", arrays.type);
    number("defsup", arrays.has_default);
    number("mode", arrays.mode);
    number("dtsiz", arrays.size);
    number("prec", arrays.precision);
    number("scale", arrays.scale);
    number("radix", arrays.radix);
    line.Character('\n').Print();
}

sword Describe(Lda_Def* login, const TextArgument& object, Arrays& arrays, ub4& size, int count, char** words) {
    int word = kFirstArray;
    const auto place = [&](auto& array) { return Place(array[0], count, words, word++); };
    auto* const overload = place(arrays.overload);
    auto* const position = place(arrays.position);
    auto* const level = place(arrays.level);
    auto* const name = place(arrays.name);
    auto* const name_length = place(arrays.name_length);
    auto* const type = place(arrays.type);
    auto* const has_default = place(arrays.has_default);
    auto* const mode = place(arrays.mode);
    auto* const value_size = place(arrays.size);
    auto* const precision = place(arrays.precision);
    auto* const scale = place(arrays.scale);
    auto* const radix = place(arrays.radix);
    auto* const spare = place(arrays.spare);
    const auto object_length = static_cast<size_t>(static_cast<ptrdiff_t>(LengthOfText(object)));
    return Call(&ClientLibrary::odessp, login, object.Text(), object_length, nullptr, 0, nullptr, 0, overload, position,
                level, name, name_length, type, has_default, mode, value_size, precision, scale, radix, spare, &size);
}

void DescribeProcedure(const CommandRow& row, int count, char** words) {
    constexpr ub2 kNameLength = 30;
    const AreaArgument login = ResolveArea(Kind::ldainfo, words[1]);
    const ub4 asked = DecodeCount(words[4]);
    if (asked > kMostArguments) return Message(kError, "Can't do more than 100 in tool\n");
    TextArgument object;
    const Memory<Arrays> arrays(static_cast<Arrays*>(GetMem(sizeof(Arrays))));
    if (arrays == nullptr || !SetAreaText(object, words + 2)) return;
    for (ub4 index = 0; index < kMostArguments; ++index) {
        arrays->name[index] = reinterpret_cast<text*>(arrays->names[index]);
        arrays->name_length[index] = kNameLength;
    }
    ub4 found = asked;
    const sword rc = Describe(login.area, object, *arrays, found, count, words);
    TraceAndReportAreas(row.code, words[1], CalledLogin(login), rc);
    if (rc != OCI_SUCCESS) return;
    Message(kOutput, "arrsiz=%ld\n", static_cast<long>(found));
    for (ub4 index = 0; index < std::min(found, asked); ++index) PrintArgument(*arrays, index, count, words);
}

constexpr PlainCommand kDescribeCommands[] = {
    {{Code::odescr, Words(3, 11), "odescr cda pos [dbsize dbtype cbuf cbufl dsize prec scale nullok]"}, DescribeColumn},
    {{Code::odessp, Words(5, 18),
      "odessp lda objectname objectname_len arrsiz [ovrld pos level argnm arnlen dtype defsup mode dtsiz prec scale "
      "radix spare]"},
     DescribeProcedure},
};

}  // namespace

void AddLegacyDescribeCommands(HandlerTable& handlers) {
    handlers.Add(kDescribeCommands);
}
