// Engine values as character data and as bytes: how each kind is written, and how a written value is laid into an
// element of each character and raw type. Text is cut between characters, never within one.
#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>

#include "date/date.h"
#include "date/format.h"
#include "handles/environment.h"
#include "handles/errors.h"
#include "number/number.h"
#include "oci.h"
#include "platform/hexadecimal.h"
#include "platform/utf.h"
#include "values/lobs.h"
#include "values/out_rows.h"
#include "values/rowid.h"

namespace values {
namespace {

using engine::Datum;
using View = std::string_view;

// ---- How values are written

int IntegerText(const Datum& datum, Workspace& workspace, View& text) {
    char* begin = workspace.small.data();
    const auto end = std::to_chars(begin, begin + workspace.small.size(), datum.integer);
    text = {begin, static_cast<std::size_t>(end.ptr - begin)};
    return 0;
}

int NumberText(const OCINumber& number, Workspace& workspace, View& text) {
    static_assert(number::kMaxPlainText <= std::tuple_size_v<decltype(Workspace::small)>);
    std::size_t length = 0;
    if (const int error = number::ToPlainText(number, '.', workspace.small.data(), &length)) return error;
    text = {workspace.small.data(), length};
    return 0;
}

// A real that is a whole number of ten-thousandths, as amounts are: up to 15 digits, written from an integer, which is
// far quicker. False for any other.
bool AmountText(double value, Workspace& workspace, View& text) {
    constexpr std::uint64_t kUnits = 10000;
    const double magnitude = std::fabs(value);
    if (!(magnitude < 1e11)) return false;
    const auto units = static_cast<std::uint64_t>(magnitude * kUnits + 0.5);
    if (static_cast<double>(units) / kUnits != magnitude) return false;
    if (units == 0) return text = "0", true;
    char* const begin = workspace.small.data();
    char* end = begin;
    if (value < 0) *end++ = '-';
    if (units >= kUnits) end = std::to_chars(end, begin + workspace.small.size(), units / kUnits).ptr;
    if (const std::uint64_t rest = units % kUnits; rest != 0) {
        *end++ = '.';
        for (const std::uint64_t digits : {rest / 1000, rest / 100, rest / 10, rest})
            *end++ = static_cast<char>('0' + digits % 10);
        while (end[-1] == '0') --end;
    }
    text = View(begin, static_cast<std::size_t>(end - begin));
    return true;
}

// What is no amount, with all digits that tell it from other reals. Infinities and what is no number have names; reals of
// usual size are written directly, in the plain form of numbers.
int OtherRealText(double value, Workspace& workspace, View& text) {
    if (std::isnan(value)) return text = "Nan", 0;
    if (std::isinf(value)) return text = value > 0 ? "Inf" : "-Inf", 0;
    const double magnitude = std::fabs(value);
    if (magnitude < 1e-6 || magnitude >= 1e15) {
        OCINumber number;
        if (const int error = number::FromDouble(value, &number)) return AsConversionError(error);
        return NumberText(number, workspace, text);
    }
    char* begin = workspace.small.data();
    const char* end = std::to_chars(begin, begin + workspace.small.size(), value, std::chars_format::fixed).ptr;
    const bool negative = *begin == '-';
    if (begin[negative] == '0') {    // no zero stands before the point
        ++begin;
        if (negative) *begin = '-';
    }
    text = {begin, static_cast<std::size_t>(end - begin)};
    return 0;
}

int BinaryRealText(const Datum& datum, Workspace& workspace, View& text) {
    return AmountText(datum.real, workspace, text) ? 0 : OtherRealText(datum.real, workspace, text);
}

int SingleRealText(const Datum& datum, Workspace& workspace, View& text) {
    Datum single = datum;
    single.real = SingleByDigits(datum.real);
    return BinaryRealText(single, workspace, text);
}

// As a number that the engine has computed, or keeps, as a real.
int RealText(const Datum& datum, Workspace& workspace, View& text) {
    if (AmountText(datum.real, workspace, text)) return 0;    // with no more digits than that
    if (const int error = OtherRealText(datum.real, workspace, text)) return error;
    if (text.size() <= number::kRealDigits) return 0;
    OCINumber number;
    if (const int error = number::FromReal15(datum.real, &number)) return error;
    return NumberText(number, workspace, text);
}

int DecimalText(const Datum& datum, Workspace& workspace, View& text) {
    return NumberText(*static_cast<const OCINumber*>(datum.data), workspace, text);
}

int OwnText(const Datum& datum, Workspace&, View& text) {
    text = datum.Text();
    return 0;
}

// A number that the engine keeps as text, in the plain form; what is no number stays as it is.
int NumericText(const Datum& datum, Workspace& workspace, View& text) {
    OCINumber number;
    if (number::FromPlainText(datum.Text(), '.', &number) != 0) return OwnText(datum, workspace, text);
    return NumberText(number, workspace, text);
}

int HexText(const Datum& datum, Workspace& workspace, View& text) {
    constexpr char kDigits[] = "0123456789ABCDEF";
    workspace.text.resize(std::size_t{datum.length} * 2);
    char* at = workspace.text.data();
    for (const char byte : datum.Text()) {
        *at++ = kDigits[static_cast<unsigned char>(byte) >> 4];
        *at++ = kDigits[static_cast<unsigned char>(byte) & 15];
    }
    text = workspace.text;
    return 0;
}

View ModelOf(ColumnClass column) {
    switch (column) {
        case ColumnClass::timestamp: return date::kTimestampModel;
        case ColumnClass::timestamp_zone: return date::kTimestampZoneModel;
        default: return date::kDateModel;
    }
}

// The default model of dates by hand: most dates are shown so, and a result set is full of them.
std::size_t ShortDate(const date::DateTime& value, char* text) {
    constexpr char kMonths[] = "JANFEBMARAPRMAYJUNJULAUGSEPOCTNOVDEC";
    const auto put = [text](std::size_t at, int number) {
        text[at] = static_cast<char>('0' + number / 10 % 10);
        text[at + 1] = static_cast<char>('0' + number % 10);
    };
    put(0, value.day);
    text[2] = text[6] = '-';
    std::copy_n(kMonths + (value.month - 1) * 3, 3, text + 3);
    put(7, value.year);
    return 9;
}

int ModelText(const date::DateTime& value, Workspace& workspace, View& text) {
    std::size_t length = 0;
    char* begin = workspace.small.data();
    if (ModelOf(workspace.column).data() == date::kDateModel.data() && value.year > 0) {
        text = {begin, ShortDate(value, begin)};
        return 0;
    }
    const auto scope = workspace.column == ColumnClass::date ? date::Scope::date : date::Scope::timestamp;
    const int error = date::ToText(value, ModelOf(workspace.column), date::kEnglish, scope, begin,
                                   workspace.small.size(), &length);
    text = {begin, length};
    return error;
}

// In the default model of the column's type.
int TimestampText(const Datum& datum, Workspace& workspace, View& text) {
    return ModelText(datum.Timestamp(), workspace, text);
}

int RowIdText(const Datum& datum, Workspace& workspace, View& text) {
    const rowid::RowId value = rowid::FromBytes(datum.Row().bytes.data());
    text = {workspace.small.data(), rowid::ToText(value, workspace.small.data())};
    return 0;
}

int NoText(const Datum&, Workspace&, View&) { return errors::kInconsistentTypes; }

// ---- How values become bytes

// Pairs of hexadecimal digits; an odd count has a zero before it.
int BytesOfHex(const Datum& datum, Workspace& workspace, View& bytes) {
    const View hex = datum.Text();
    workspace.text.assign((hex.size() + 1) / 2, '\0');
    for (std::size_t index = 0; index < hex.size(); ++index) {
        const int digit = HexDigit(hex[index]);
        if (digit < 0) return errors::kBadHexadecimal;
        char& byte = workspace.text[(index + hex.size() % 2) / 2];
        byte = static_cast<char>(static_cast<unsigned char>(byte) << 4 | digit);
    }
    bytes = workspace.text;
    return 0;
}

// ---- How character data is laid into elements

// Copies as much as `room` takes; answers the bytes copied.
std::size_t CopyCut(View text, const Workspace& workspace, char* at, std::size_t room, Target& target) {
    const std::size_t stored = WholeCharacters(workspace, text, room);
    if (stored > 0) std::memcpy(at, text.data(), stored);
    target.stored = static_cast<std::uint32_t>(stored);
    target.whole = text.size();
    return stored;
}

int Outcome(const Target& target, std::size_t copied) { return copied < target.whole ? errors::kTruncated : 0; }

int PutChr(View utf8, Workspace& workspace, Target& target) {
    View text;
    if (const int error = ToApplication(utf8, workspace, text)) return error;
    return Outcome(target, CopyCut(text, workspace, target.at, target.size, target));
}

// Closed with a zero that the length does not count.
int PutStr(View utf8, Workspace& workspace, Target& target) {
    View text;
    if (const int error = ToApplication(utf8, workspace, text)) return error;
    const std::size_t zero = workspace.utf16 ? 2 : 1;
    target.whole = text.size();
    if (target.size < zero) return errors::kTruncated;
    const std::size_t stored = CopyCut(text, workspace, target.at, target.size - zero, target);
    std::memset(target.at + stored, 0, zero);
    return Outcome(target, stored);
}

// Padded with blanks to the end of the area, which is its length.
int PutAfc(View utf8, Workspace& workspace, Target& target) {
    View text;
    if (const int error = ToApplication(utf8, workspace, text)) return error;
    const std::size_t stored = CopyCut(text, workspace, target.at, target.size, target);
    if (!workspace.utf16) {
        std::memset(target.at + stored, ' ', target.size - stored);
    } else {
        const View blank = charset::Blank(*workspace.set);
        for (std::size_t at = stored; at + 2 <= target.size; at += 2) std::memcpy(target.at + at, blank.data(), 2);
    }
    target.stored = target.size;
    return Outcome(target, stored);
}

// The first `stored` bytes behind a count of them.
template <class Prefix>
int LayPrefixed(View text, std::size_t stored, Target& target) {
    const auto prefix = static_cast<Prefix>(stored);
    std::memcpy(target.at, &prefix, sizeof prefix);
    if (stored > 0) std::memcpy(target.at + sizeof prefix, text.data(), stored);
    target.stored = static_cast<std::uint32_t>(stored + sizeof prefix);
    target.whole = text.size();
    return Outcome(target, stored);
}
template <class Prefix>
std::size_t PrefixedRoom(const Target& target) {
    return std::min<std::size_t>(target.size - sizeof(Prefix), std::numeric_limits<Prefix>::max());
}

template <class Prefix>
int PutPrefixed(View utf8, Workspace& workspace, Target& target) {
    View text;
    if (const int error = ToApplication(utf8, workspace, text)) return error;
    const std::size_t room = PrefixedRoom<Prefix>(target);
    return LayPrefixed<Prefix>(text, WholeCharacters(workspace, text, room), target);
}

// ---- How bytes are

int PutBin(View bytes, Workspace&, Target& target) {
    const std::size_t stored = std::min<std::size_t>(bytes.size(), target.size);
    if (stored > 0) std::memcpy(target.at, bytes.data(), stored);
    target.stored = static_cast<std::uint32_t>(stored);
    target.whole = bytes.size();
    return Outcome(target, stored);
}

int PutVbi(View bytes, Workspace&, Target& target) {
    return LayPrefixed<std::uint16_t>(bytes, std::min(bytes.size(), PrefixedRoom<std::uint16_t>(target)), target);
}

// ---- Large objects, as far as an element takes them

// `text`: as text, else as bytes.
int LobForm(const Datum& value, bool as_text, Workspace& workspace, View& form) {
    if (as_text) return value.kind == engine::Kind::text ? OwnText(value, workspace, form) : HexText(value, workspace, form);
    return value.kind == engine::Kind::text ? BytesOfHex(value, workspace, form) : OwnText(value, workspace, form);
}

template <bool as_text>
int WholeLob(const Datum& datum, Workspace& workspace, View& form) {
    Datum value;
    std::uint64_t length = 0;
    if (const int error = ReadLob(datum, workspace.lobs.get(), kWholeLob, workspace.content, value, length)) return error;
    return LobForm(value, as_text, workspace, form);
}

// No more is read than an area of that size can show, where the whole length is known without. Objects take all.
template <auto put, bool as_text>
int PutLob(const Datum& datum, Workspace& workspace, Target& target) {
    constexpr bool is_object = put == PutString || put == PutRaw;
    const std::uint64_t most = is_object || workspace.set ? kWholeLob : 2 * std::uint64_t{target.size} + 8;
    Datum value;
    std::uint64_t length = 0;
    if (const int error = ReadLob(datum, workspace.lobs.get(), most, workspace.content, value, length)) return error;
    const bool is_hex = as_text && value.kind != engine::Kind::text;
    const bool is_unhexed = !as_text && value.kind == engine::Kind::text;
    const bool is_part = length > value.length;
    // The single digit of an odd count is the first, however much is read: what is left away are pairs.
    if (is_unhexed && is_part) value.length -= static_cast<std::uint32_t>((length - value.length) % 2);
    View form;
    if (const int error = LobForm(value, as_text, workspace, form)) return error;
    const int error = put(form, workspace, target);
    if (is_part) target.whole = is_hex ? length * 2 : is_unhexed ? (length + 1) / 2 : length;
    return error;
}

template <auto put>
constexpr ByOrigin<OutConverter> kTextRow = {
    NoConversion,                    Through<View, IntegerText, put>, Through<View, RealText, put>,
    Through<View, DecimalText, put>, Through<View, OwnText, put>,     Through<View, HexText, put>,
    Through<View, TimestampText, put>, PutLob<put, true>,             Through<View, RowIdText, put>,
    NoConversion,                    Through<View, NumericText, put>, Through<View, BinaryRealText, put>,
    Through<View, SingleRealText, put>, Through<View, OwnText, put>};

template <auto put>
constexpr ByOrigin<OutConverter> kBytesRow = {
    NoConversion, NoConversion, NoConversion, NoConversion, Through<View, BytesOfHex, put>, Through<View, OwnText, put>,
    NoConversion, PutLob<put, false>, NoConversion, NoConversion, NoConversion, NoConversion, NoConversion, NoConversion};

}  // namespace

int ToApplication(View utf8, Workspace& workspace, View& text) {
    text = utf8;
    if (!workspace.set) return 0;
    workspace.units.clear();
    if (!charset::FromUtf8(*workspace.set, utf8, workspace.units)) return errors::kBadCharacters;
    text = workspace.units;
    return 0;
}

const ByOrigin<OutConverter> kToChr = kTextRow<PutChr>;
const ByOrigin<OutConverter> kToStr = kTextRow<PutStr>;
const ByOrigin<OutConverter> kToAfc = kTextRow<PutAfc>;
const ByOrigin<OutConverter> kToPrefix2 = kTextRow<PutPrefixed<std::uint16_t>>;
const ByOrigin<OutConverter> kToPrefix4 = kTextRow<PutPrefixed<std::uint32_t>>;
const ByOrigin<OutConverter> kToString = kTextRow<PutString>;
const ByOrigin<OutConverter> kToBin = kBytesRow<PutBin>;
const ByOrigin<OutConverter> kToVbi = kBytesRow<PutVbi>;
const ByOrigin<OutConverter> kToRaw = kBytesRow<PutRaw>;

const ByOrigin<Renderer> kWholeText = {NoText, IntegerText, RealText, DecimalText, OwnText, HexText,
                                       TimestampText, WholeLob<true>, RowIdText, NoText, NumericText, BinaryRealText, SingleRealText,
                                       OwnText};
const ByOrigin<Renderer> kWholeBytes = {NoText, NoText, NoText, NoText, BytesOfHex, OwnText,
                                        NoText, WholeLob<false>, NoText, NoText, NoText, NoText, NoText, NoText};

}  // namespace values
