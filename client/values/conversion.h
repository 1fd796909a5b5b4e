// Conversions between the engine's values (Datum) and the external types of the application's elements, both ways. What
// converts is looked up once, when a bind or define is made; a value then takes one call through a pointer and
// allocates nothing once the workspace has grown to the longest value.
//
// Conversions answer 0 or a published error number. Truncation is 1406 with the value stored as far as it fits.
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>

#include "engine/datum.h"
#include "engine/lobs.h"
#include "handles/character_set.h"
#include "platform/utf.h"
#include "values/elements.h"

class Environment;

namespace values {

struct LobSession;

// What a select-list column holds, as far as its values convert in their own way.
enum class ColumnClass : std::uint8_t { plain, number, binary_float, binary_double, date, timestamp, timestamp_zone };
ColumnClass ClassOf(std::uint16_t internal_type);

// Settings of one bind or define, and the room in which its values are put together.
struct Workspace {
    Environment* environment = nullptr;
    std::atomic<const void*> holder{nullptr};    // the bind or define handle; null once it is gone
    const CharacterSet* set = nullptr;  // of the application's character data; null: UTF-8
    bool utf16 = false;                 // its units have two bytes
    ColumnClass column = ColumnClass::plain;
    std::uint8_t precision = 0;         // of packed decimals; 0: as many digits as the area holds
    std::int8_t scale = 0;
    alignas(8) std::array<char, 128> small{};    // numbers, dates, row ids
    std::string text;                   // converted texts and bytes
    std::string content;                // of a large object
    std::shared_ptr<engine::Lob> object;    // that goes in as it is
    std::shared_ptr<LobSession> lobs;   // of the session that the bind or define is used in
    std::string units;                  // text in the application's set

    void Use(const CharacterSet& of_application) {
        set = charset::IsUtf8(of_application) ? nullptr : &of_application;
        utf16 = charset::IsUtf16(of_application);
    }
};

// As much of a text in the application's set as `room` bytes hold of whole characters.
inline std::size_t WholeCharacters(const Workspace& workspace, std::string_view text, std::size_t room) {
    return workspace.set ? charset::Whole(*workspace.set, text, room) : utf::WholeUtf8(text, room);
}

// An element to be filled. Conversions set `stored` and, when something was cut off, `whole`.
struct Target {
    char* at;
    std::uint32_t size;
    std::uint32_t stored = 0;    // bytes, as the length array reports them
    std::size_t whole = 0;       // bytes of the whole value
};

// An element to be read.
struct Source {
    const char* at;
    std::uint32_t size;
    bool has_length;
    std::uint32_t length;
};

using OutConverter = int (*)(const engine::Datum& datum, Workspace& workspace, Target& target);
// The Datum is a view of the element or of the workspace; of kind null when the element stands for null.
using InConverter = int (*)(const Source& source, Workspace& workspace, engine::Datum& datum);
// A whole value in the form that is handed out in pieces.
using Renderer = int (*)(const engine::Datum& datum, Workspace& workspace, std::string_view& whole);

// What stands behind a Datum: its kind; or a number that arrives as text, a real of a binary column of either width
// (other reals stand for numbers), a text in a column of dates.
constexpr std::size_t kKinds = engine::kKinds;
constexpr std::size_t kNumberText = kKinds;
constexpr std::size_t kBinaryReal = kKinds + 1;
constexpr std::size_t kSingleReal = kKinds + 2;
constexpr std::size_t kDateText = kKinds + 3;
template <class Function>
using ByOrigin = std::array<Function, kKinds + 4>;
// By the kind of Datum, for one column.
template <class Function>
using ByKind = std::array<Function, kKinds>;

enum class Family : std::uint8_t { text, bytes, number, integer, real, date, interval, row_id, cursor, lob };

struct ExternalType {
    std::uint16_t code;
    Family family;
    std::uint8_t least_size;    // bytes an area must have
    bool in_pieces;             // whether values may be given and taken in pieces
    bool is_pointer;            // the element points to an object
    InConverter in;
    const ByOrigin<OutConverter>* out;
    const ByOrigin<Renderer>* pieces;    // null unless in_pieces
};

// A type code and an area size as the application gives them. `area` is how large an element counts. 3115 for a code
// that the library does not know (`type` is left alone), 1459 or 1483 for a size that the type cannot have.
// `may_be_null`: numbers and dates without any size are nulls, as binds take them.
int FindType(std::uint16_t code, std::int64_t size, bool may_be_null, const ExternalType*& type, std::uint32_t& area);

// The kind of Datum that an element becomes when it is read, unless it is null. Whole numbers that fit arrive as
// integers even where this says decimal.
engine::Kind KindOf(const ExternalType& type, std::uint32_t size);

// The row of a table that serves a column.
template <class Function>
ByKind<Function> ForColumn(const ByOrigin<Function>& row, ColumnClass column) {
    ByKind<Function> functions;
    for (std::size_t kind = 0; kind < kKinds; ++kind) functions[kind] = row[kind];
    const auto set = [&](engine::Kind kind, std::size_t origin) {
        functions[static_cast<std::size_t>(kind)] = row[origin];
    };
    switch (column) {
        case ColumnClass::plain: break;
        case ColumnClass::number: set(engine::Kind::text, kNumberText); break;
        case ColumnClass::binary_float: set(engine::Kind::real, kSingleReal); break;
        case ColumnClass::binary_double: set(engine::Kind::real, kBinaryReal); break;
        case ColumnClass::date:
        case ColumnClass::timestamp:
        case ColumnClass::timestamp_zone:
            set(engine::Kind::text, kDateText);
            break;
    }
    return functions;
}

// Puts one value into an element with its indicator, length and return code. Answers 0, 24345 for what is only a
// warning (a return code took it), or the error of the call.
int Store(const Elements& elements, std::size_t index, const ByKind<OutConverter>& converters, Workspace& workspace,
          const engine::Datum& datum);

// A value of a single-precision column with the digits that tell it from others of that width; what needs double
// precision stays as it is.
double SingleByDigits(double value);

// An error of the number package as that of a conversion.
int AsConversionError(int error);

// UTF-8 in the application's form: itself, or its set in the workspace.
// What stands for the number of an error when the application has freed the bind or define in mid-call, from a memory
// function: its memory is not touched any more.
constexpr int kPlaceGone = -1;

int ToApplication(std::string_view utf8, Workspace& workspace, std::string_view& text);

// Reads one element.
inline int Load(const Elements& elements, std::size_t index, InConverter in, Workspace& workspace,
                engine::Datum& datum) {
    datum.kind = engine::Kind::null;
    const char* at = elements.Value(index);
    if (!at || elements.IsNull(index)) return 0;
    const bool has_length = elements.lengths != nullptr;
    return in({at, elements.size, has_length, has_length ? elements.Length(index) : 0}, workspace,
              datum);
}

}  // namespace values
