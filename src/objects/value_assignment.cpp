// One table from type to the function that stores a text as that type.
#include "objects/value_assignment.h"

#include <algorithm>
#include <cctype>
#include <charconv>
#include <limits>
#include <optional>
#include <string>
#include <string_view>

#include "core/keywords.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "objects/element_access.h"
#include "objects/library_number.h"
#include "objects/registry.h"
#include "objects/text_conversion.h"
#include "oci.h"
#include "platform/client_library.h"
#include "platform/decimal_float.h"
#include "platform/packed_decimal.h"

namespace {

// What a script has given for the element. Characters and bytes are taken as the length says; types of a fixed size
// take the whole word.
struct Value {
    const char* word;
    std::string text;  // as many bytes of the word as the length says, converted where the type takes characters
};

// The length of what was stored; nothing when the value cannot be read as the type.
using Stored = std::optional<uint32_t>;
using Assign = Stored (*)(const ElementTarget& target, const Value& value);

// --- Characters and bytes ------------------------------------------------------------------------------------------

uint32_t CharacterSize() {
    return Utf16Mode ? 2 : 1;
}

// Copies what fits into `room` bytes of the element from `offset` on; whole characters only when they are UTF-16.
uint32_t Copy(const ElementTarget& target, uint32_t offset, std::string_view bytes, uint32_t room, uint32_t unit = 1) {
    auto count = static_cast<uint32_t>(std::min<size_t>(bytes.size(), room));
    count -= count % unit;
    std::copy_n(bytes.data(), count, reinterpret_cast<char*>(target.data) + offset);
    return count;
}

Stored AssignCharacters(const ElementTarget& target, const Value& value) {
    return Copy(target, 0, value.text, target.size, CharacterSize());
}

Stored AssignTerminated(const ElementTarget& target, const Value& value) {
    const uint32_t unit = CharacterSize();
    if (target.size < unit) return 0;
    const uint32_t count = Copy(target, 0, value.text, target.size - unit, unit);
    std::fill_n(target.data + count, unit, static_cast<unsigned char>(0));
    return count;
}

Stored AssignPadded(const ElementTarget& target, const Value& value) {
    const uint32_t unit = CharacterSize();
    const uint32_t count = Copy(target, 0, value.text, target.size, unit);
    for (uint32_t index = count; index < target.size; ++index)
        target.data[index] = (index - count) % unit == 0 ? ' ' : 0;
    return target.size;
}

template <class Prefix> Stored AssignPrefixed(const ElementTarget& target, std::string_view bytes, uint32_t unit) {
    if (target.size < sizeof(Prefix)) return 0;
    const auto room = static_cast<uint32_t>(
        std::min<uint64_t>(target.size - sizeof(Prefix), static_cast<uint64_t>(std::numeric_limits<Prefix>::max())));
    const uint32_t count = Copy(target, sizeof(Prefix), bytes, room, unit);
    WriteElement(target.data, target.size, static_cast<Prefix>(count));
    return static_cast<uint32_t>(sizeof(Prefix)) + count;
}

template <class Prefix> Stored AssignPrefixedCharacters(const ElementTarget& target, const Value& value) {
    return AssignPrefixed<Prefix>(target, value.text, CharacterSize());
}

int HexDigit(char character) {
    if (std::isdigit(static_cast<unsigned char>(character)) != 0) return character - '0';
    const int letter = std::toupper(static_cast<unsigned char>(character));
    return letter >= 'A' && letter <= 'F' ? letter - 'A' + 10 : -1;
}

// The bytes of a value: those that a word X'...' spells, else its text. Nothing when the digits are no pairs.
std::optional<std::string> BytesOf(const Value& value) {
    std::string_view digits = value.word;
    if (digits.size() < 3 || !digits.starts_with("X'") || !digits.ends_with('\'')) return value.text;
    digits = digits.substr(2, digits.size() - 3);
    if (digits.size() % 2 != 0) return std::nullopt;
    std::string bytes;
    for (size_t index = 0; index < digits.size() && bytes.size() < value.text.size(); index += 2) {
        const int high = HexDigit(digits[index]), low = HexDigit(digits[index + 1]);
        if (high < 0 || low < 0) return std::nullopt;
        bytes.push_back(static_cast<char>(high * 16 + low));
    }
    return bytes;
}

Stored AssignBytes(const ElementTarget& target, const Value& value) {
    const std::optional<std::string> bytes = BytesOf(value);
    if (!bytes) return std::nullopt;
    return Copy(target, 0, *bytes, target.size);
}

Stored AssignPrefixedBytes(const ElementTarget& target, const Value& value) {
    const std::optional<std::string> bytes = BytesOf(value);
    if (!bytes) return std::nullopt;
    return AssignPrefixed<uint16_t>(target, *bytes, 1);
}

Stored AssignRowidBytes(const ElementTarget& target, const Value& value) {
    return Copy(target, 0, value.text, target.size);
}

// --- Library strings and raws --------------------------------------------------------------------------------------

constexpr uint32_t kPointerLength = 8;

Stored AssignLibraryString(const ElementTarget& target, const Value& value) {
    auto* string = ReadElement<OCIString*>(target.data, target.size);
    const auto* text = reinterpret_cast<const OraText*>(value.text.data());
    const sword rc = Call(&ClientLibrary::OCIStringAssignText, DefaultEnvironment, DefaultErrorHandle, text,
                          static_cast<ub4>(value.text.size()), &string);
    if (rc != OCI_SUCCESS) return std::nullopt;
    WriteElement(target.data, target.size, string);
    return kPointerLength;
}

Stored AssignLibraryRaw(const ElementTarget& target, const Value& value) {
    auto* raw = ReadElement<OCIRaw*>(target.data, target.size);
    const auto* bytes = reinterpret_cast<const ub1*>(value.text.data());
    const sword rc = Call(&ClientLibrary::OCIRawAssignBytes, DefaultEnvironment, DefaultErrorHandle, bytes,
                          static_cast<ub4>(value.text.size()), &raw);
    if (rc != OCI_SUCCESS) return std::nullopt;
    WriteElement(target.data, target.size, raw);
    return kPointerLength;
}

// --- Numbers -------------------------------------------------------------------------------------------------------

// Reads the whole text as a number of the type; nothing when something is left over or it does not fit.
template <class Number> std::optional<Number> ReadNumber(std::string_view text) {
    if (text.starts_with('+')) text.remove_prefix(1);
    Number number{};
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return number;
}

template <class Number> Stored AssignNumber(const ElementTarget& target, std::string_view text) {
    const std::optional<Number> number = ReadNumber<Number>(text);
    if (!number) return std::nullopt;
    WriteElement(target.data, target.size, *number);
    return target.size;
}

template <class Wide, class Long, class Short, class Tiny>
Stored AssignInteger(const ElementTarget& target, const Value& value) {
    if (target.size >= sizeof(Wide)) return AssignNumber<Wide>(target, value.word);
    if (target.size >= sizeof(Long)) return AssignNumber<Long>(target, value.word);
    if (target.size >= sizeof(Short)) return AssignNumber<Short>(target, value.word);
    return AssignNumber<Tiny>(target, value.word);
}

Stored AssignReal(const ElementTarget& target, const Value& value) {
    if (target.size == sizeof(float)) return AssignNumber<float>(target, value.word);
    if (target.size == sizeof(double) || target.size == 16) return AssignNumber<double>(target, value.word);
    return std::nullopt;
}

Stored AssignLibraryNumber(const ElementTarget& target, const Value& value) {
    OCINumber number;
    if (NumberFromText(value.word, number) != OCI_SUCCESS) return std::nullopt;
    WriteElement(target.data, target.size, number);
    return sizeof number;
}

Stored AssignPackedDecimal(const ElementTarget& target, const Value& value) {
    if (PackedDecimalSize(target.precision) > target.size) return std::nullopt;
    if (TextToDecimal(value.word, target.data, target.precision, target.scale) != kDecimalDone) return std::nullopt;
    return target.size;
}

template <uint32_t kSize> Stored AssignDecimalFloat(const ElementTarget& target, const Value& value) {
    unsigned char bytes[kSize];
    if (!decimal_float::FromText(value.word, kSize, bytes)) return std::nullopt;
    return Copy(target, 0, {reinterpret_cast<const char*>(bytes), kSize}, target.size);
}

// --- Dates ---------------------------------------------------------------------------------------------------------

Stored AssignSevenByteDate(const ElementTarget& target, const Value& value) {
    SevenByteDate date;
    if (!ReadDateLiteral(value.word, date)) return std::nullopt;
    date.Write(target.data, target.size);
    return 7;
}

Stored AssignDate(const ElementTarget& target, const Value& value) {
    SevenByteDate fields;
    if (!ReadDateLiteral(value.word, fields)) return std::nullopt;
    OCIDate date{};
    date.OCIDateYYYY = static_cast<sb2>(fields.year);
    date.OCIDateMM = static_cast<ub1>(fields.month);
    date.OCIDateDD = static_cast<ub1>(fields.day);
    date.OCIDateTime = {static_cast<ub1>(fields.hour), static_cast<ub1>(fields.minute),
                        static_cast<ub1>(fields.second)};
    WriteElement(target.data, target.size, date);
    return sizeof date;
}

// --- Registered objects --------------------------------------------------------------------------------------------

template <Kind kKind> Stored AssignObject(const ElementTarget& target, const Value& value) {
    void* object = IsInvalid(value.word) ? InvalidObject() : nullptr;
    if (object == nullptr && !FindObject(kKind, value.word, object)) return std::nullopt;
    WriteElement(target.data, target.size, object);
    return kPointerLength;
}

// A result set is a result descriptor or, once it is open, a statement.
Stored AssignResultSet(const ElementTarget& target, const Value& value) {
    const Stored stored = AssignObject<Kind::result>(target, value);
    return stored ? stored : AssignObject<Kind::stmt>(target, value);
}

// --- Types ---------------------------------------------------------------------------------------------------------

struct TypeAssignment {
    int type;
    Assign assign;
    bool characters = false;  // the text is converted in UTF-16 mode
};

constexpr TypeAssignment kTypeAssignments[] = {
    {SQLT_CHR, AssignCharacters, true},
    {SQLT_NUM, AssignLibraryNumber},
    {SQLT_INT, AssignInteger<int64_t, int32_t, int16_t, int8_t>},
    {SQLT_FLT, AssignReal},
    {SQLT_STR, AssignTerminated, true},
    {SQLT_VNU, AssignLibraryNumber},
    {SQLT_PDN, AssignPackedDecimal},
    {SQLT_LNG, AssignCharacters, true},
    {SQLT_VCS, AssignPrefixedCharacters<uint16_t>, true},
    {SQLT_RID, AssignRowidBytes},
    {SQLT_DAT, AssignSevenByteDate},
    {SQLT_VBI, AssignPrefixedBytes},
    {SQLT_BFLOAT, AssignDecimalFloat<8>},
    {SQLT_BDOUBLE, AssignDecimalFloat<16>},
    {SQLT_BIN, AssignBytes},
    {SQLT_LBI, AssignBytes},
    {SQLT_UIN, AssignInteger<uint64_t, uint32_t, uint16_t, uint8_t>},
    {SQLT_LVC, AssignPrefixedCharacters<int32_t>, true},
    {SQLT_LVB, AssignLibraryRaw},
    {SQLT_AFC, AssignPadded, true},
    {SQLT_AVC, AssignPrefixedCharacters<uint16_t>, true},
    {SQLT_CUR, AssignObject<Kind::stmt>},
    {SQLT_RDD, AssignObject<Kind::rowid>},
    {SQLT_CLOB, AssignObject<Kind::lob>},
    {SQLT_BLOB, AssignObject<Kind::lob>},
    {SQLT_RSET, AssignResultSet},
    {SQLT_VST, AssignLibraryString, true},
    {SQLT_ODT, AssignDate},
    {SQLT_DATE, AssignObject<Kind::datetime>},
    {SQLT_TIMESTAMP, AssignObject<Kind::datetime>},
    {SQLT_TIMESTAMP_TZ, AssignObject<Kind::datetime>},
    {SQLT_TIMESTAMP_LTZ, AssignObject<Kind::datetime>},
};

const TypeAssignment* FindAssignment(int type) {
    const auto row = std::ranges::find(kTypeAssignments, type, &TypeAssignment::type);
    return row == std::end(kTypeAssignments) ? nullptr : row;
}

// `length` bytes of the word, zeros for those beyond its end as far as an element takes them.
std::string Cut(const char* word, long length, uint32_t room) {
    constexpr size_t kLeast = std::numeric_limits<uint16_t>::max();
    std::string text(word);
    const size_t most = std::max({kLeast, text.size(), size_t{room}});
    text.resize(std::min(static_cast<size_t>(std::max(length, 0L)), most));
    return text;
}

// False after a failed conversion, which has been complained about.
bool ConvertToUtf16(std::string& text) {
    std::string converted(4 * text.size() + 1, '\0');
    uint32_t length = 0;
    const int rc = convertToUTF16(text.data(), static_cast<uint32_t>(text.size()), converted.data(),
                                  static_cast<uint32_t>(converted.size()), &length);
    if (!IsTolerated(rc)) return false;
    converted.resize(length);
    text = std::move(converted);
    return true;
}

}  // namespace

bool AssignText(const ElementTarget& target, const char* word, long length) {
    constexpr int16_t kNull = -1;
    if (IsNull(word)) {
        *target.indicator = kNull;
        *target.length = 0;
        return true;
    }
    const TypeAssignment* row = FindAssignment(target.type);
    Value value{word, Cut(word, length, target.size)};
    if (row != nullptr && row->characters && Utf16Mode && !ConvertToUtf16(value.text)) return false;
    const Stored stored = row == nullptr ? std::nullopt : row->assign(target, value);
    if (!stored) {
        Message(kError, "Invalid value - %s\n", word);
        return false;
    }
    *target.indicator = 0;
    *target.return_code = 0;
    *target.length = FieldOfLength(*stored);
    return true;
}
