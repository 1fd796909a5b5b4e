// The number commands that have handlers of their own: reals, integers and texts.
#include "commands/values/number_conversions.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "commands/values/number_values.h"
#include "core/state.h"
#include "objects/element_access.h"
#include "objects/memory.h"
#include "objects/text_conversion.h"
#include "platform/numbers.h"

namespace {

// --- Reals -----------------------------------------------------------------------------------------------------------

bool IsRealWidth(int width) {
    return width == 4 || width == 8 || width == 16;
}

// A real of 4, 8 or 16 bytes. Of any other width there is none, and the library gets a null pointer.
class Real {
public:
    explicit Real(int width) : width_(width) {}

    void* Pointer() { return IsRealWidth(width_) ? bytes_ : nullptr; }

    // False after a range error. What is read for 16 bytes is no more precise than for 8.
    bool Read(const char* word) {
        errno = 0;
        if (width_ == 4) Set(std::strtof(word, nullptr));
        if (width_ == 8) Set(std::strtod(word, nullptr));
        if (width_ == 16) Set(static_cast<long double>(std::strtod(word, nullptr)));
        return errno != ERANGE;
    }

private:
    template <class T> void Set(T value) { std::memcpy(bytes_, &value, sizeof value); }

    int width_;
    alignas(16) unsigned char bytes_[16] = {};
};

void RunFromReal(const CommandRow& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    const int width = DecodeNumber(words[3]);
    Real real(width);
    if (!real.Read(words[2])) return Message(kError, "Invalid number - %s\n", words[2]);
    const void* const value = IsNull(words[2]) ? nullptr : real.Pointer();
    ResultPlace<OCINumber> result(count, words, 4);
    const sword rc = Call(&ClientLibrary::OCINumberFromReal, error, value, static_cast<uword>(width), result.Pointer());
    Conclude(row.code, error, rc, result);
}

// The way back from a real that the library made; a failure is reported.
bool NumberFromReal(const void* real, int width, OCIError* error, OCINumber& number) {
    const sword rc = Call(&ClientLibrary::OCINumberFromReal, error, real, static_cast<uword>(width), &number);
    if (rc != OCI_SUCCESS) ReturnCodeReport(error, rc);
    return rc == OCI_SUCCESS;
}

void RunToReal(const CommandRow& row, int count, char** words) {
    ErrorWord error(words[1]);
    NumberOperand operand;
    if (!operand.Resolve(words[2], error)) return;
    const int width = DecodeNumber(words[3]);
    Real real(width);
    ResultPlace<OCINumber> result(count, words, 4);
    void* const place = result.Pointer() == nullptr ? nullptr : real.Pointer();
    const sword rc = Call(&ClientLibrary::OCINumberToReal, error.Get(), operand.Argument(), static_cast<uword>(width),
                          place);
    TraceAndReport(row.code, "", error.Get(), rc);
    if (rc != OCI_SUCCESS || place == nullptr) return;
    if (NumberFromReal(place, width, error.Get(), *result.Pointer())) result.PrintAndStore(error.Get());
}

// A block for `count` elements of `size` bytes, or a null pointer after a complaint. A negative size is more than there
// is.
template <class T> Memory<T> Elements(size_t count, long size, const char* complaint) {
    Memory<T> block(static_cast<T*>(GetMem(size < 0 ? SIZE_MAX : count * static_cast<size_t>(size))));
    if (block == nullptr) MessageText(kError, complaint);
    return block;
}

// The operand words beyond `elems` are ignored; more elements than words are refused.
void RunToRealArray(const CommandRow& row, int count, char** words) {
    const int elems = DecodeNumber(words[2]);
    const int width = DecodeNumber(words[3]);
    char** const operands = words + 4;
    if (elems < 0 || elems > count - 4) return InvalidSyntax(row.usage);
    OCIError* const error = ResolveError<OCIError>(words[1]);

    const size_t size = static_cast<size_t>(elems);
    const auto numbers = Elements<OCINumber>(size, sizeof(OCINumber), "Could not allocate memory for pNumber\n");
    if (numbers == nullptr) return;
    const auto pointers = Elements<const OCINumber*>(size, sizeof(void*), "Could not allocate memory for ppNum\n");
    if (pointers == nullptr) return;
    const auto reals = Elements<unsigned char>(size, width, "Could not allocate memory for num\n");
    if (reals == nullptr) return;

    for (size_t index = 0; index < size; ++index) {
        pointers.get()[index] = numbers.get() + index;
        if (ConvertStringToNumber(operands[index], error, numbers.get()[index]) != 0) return;
    }
    const sword rc = Call(&ClientLibrary::OCINumberToRealArray, error, pointers.get(), static_cast<uword>(elems),
                          static_cast<uword>(width), reals.get());
    TraceAndReport(row.code, "", error, rc);
    if (rc != OCI_SUCCESS || !IsRealWidth(width)) return;
    for (size_t index = 0; index < size; ++index) {
        OCINumber number;
        if (!NumberFromReal(reals.get() + index * static_cast<size_t>(width), width, error, number)) return;
        PrintNumber(number, error);
    }
}

// --- Integers --------------------------------------------------------------------------------------------------------

// An integer of 1, 2, 4 or 8 bytes. Of any other width there is none, and the library gets a null pointer.
class Integer {
public:
    Integer(int width, bool is_signed) : width_(width), is_signed_(is_signed) {}

    void* Pointer() { return Exists() ? bytes_ : nullptr; }

    void Read(const char* word) {
        if (width_ == 8) return is_signed_ ? Set(StrToInt64(word)) : Set(StrToUint64(word));
        const long value = DecodeLong(word);
        if (width_ == 1) Set(static_cast<uint8_t>(value));
        if (width_ == 2) Set(static_cast<uint16_t>(value));
        if (width_ == 4) Set(static_cast<uint32_t>(value));
    }
    void Print() const {
        const auto size = static_cast<size_t>(width_);
        if (!Exists()) return;
        if (is_signed_) return Message(kOutput, "%lld\n", static_cast<long long>(ReadSigned(bytes_, size)));
        Message(kOutput, "%llu\n", static_cast<unsigned long long>(ReadUnsigned(bytes_, size)));
    }

private:
    bool Exists() const { return width_ == 1 || width_ == 2 || width_ == 4 || width_ == 8; }
    template <class T> void Set(T value) { std::memcpy(bytes_, &value, sizeof value); }

    int width_;
    bool is_signed_;
    alignas(8) unsigned char bytes_[8] = {};
};

void RunFromInt(const CommandRow& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    const int width = DecodeNumber(words[3]);
    const int sign = DecodeKeywordOrNumber(words[4], NumberSignKeywords);
    Integer integer(width, sign == OCI_NUMBER_SIGNED);
    integer.Read(words[2]);
    const void* const value = IsNull(words[2]) ? nullptr : integer.Pointer();
    ResultPlace<OCINumber> result(count, words, 5);
    const sword rc = Call(&ClientLibrary::OCINumberFromInt, error, value, static_cast<uword>(width),
                          static_cast<uword>(sign), result.Pointer());
    Conclude(row.code, error, rc, result);
}

// A last word "null" stands for the number, not for the integer.
void RunToInt(const CommandRow& row, int count, char** words) {
    ErrorWord error(words[1]);
    NumberOperand operand;
    if (!operand.Resolve(words[2], error)) return;
    const OCINumber* const number = count == 6 && IsNull(words[5]) ? nullptr : operand.Argument();
    const int width = DecodeNumber(words[3]);
    const int sign = DecodeKeywordOrNumber(words[4], NumberSignKeywords);
    Integer integer(width, sign == OCI_NUMBER_SIGNED);
    const sword rc = Call(&ClientLibrary::OCINumberToInt, error.Get(), number, static_cast<uword>(width),
                          static_cast<uword>(sign), integer.Pointer());
    TraceAndReport(row.code, "", error.Get(), rc);
    if (rc == OCI_SUCCESS) integer.Print();
}

// --- Texts -----------------------------------------------------------------------------------------------------------

constexpr int kLargestTextSize = 100;
// What the library really gets: no text of a number is longer, so that a size below 0, which it takes for a huge one,
// does no harm.
OraText text_area[32 * 1024];

void RunToText(const CommandRow& row, int count, char** words) {
    ErrorWord error(words[1]);
    NumberOperand operand;
    TextArgument format;
    TextArgument nls;
    if (!operand.Resolve(words[2], error) || !format.SetWords(words + 3) || !nls.SetWords(words + 5)) return;
    const int typed = DecodeNumber(words[7]);
    if (typed > kLargestTextSize) return Message(kError, "buf_size must be smaller than %d\n", kLargestTextSize);
    ub4 size = static_cast<ub4>(typed);
    ub4* const size_place = IsNull(words[7]) ? nullptr : &size;
    OraText* const text = count == 9 && IsNull(words[8]) ? nullptr : text_area;
    const sword rc = Call(&ClientLibrary::OCINumberToText, error.Get(), operand.Argument(), format.Text(),
                          format.Length(), nls.Text(), nls.Length(), size_place, text);
    TraceAndReport(row.code, "", error.Get(), rc);
    if (rc != OCI_SUCCESS || text == nullptr) return;
    Line line;
    if (AddText(line, text, std::min<size_t>(size, sizeof text_area), Utf16Mode)) line.Character('\n').Print();
}

void RunFromText(const CommandRow& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    TextArgument number;
    TextArgument format;
    TextArgument nls;
    if (!number.SetWords(words + 2) || !format.SetWords(words + 4) || !nls.SetWords(words + 6)) return;
    ResultPlace<OCINumber> result(count, words, 8);
    const sword rc = Call(&ClientLibrary::OCINumberFromText, error, number.Text(), number.Length(), format.Text(),
                          format.Length(), nls.Text(), nls.Length(), result.Pointer());
    TraceAndReport(row.code, "", error, rc);
    if (rc == OCI_SUCCESS && result.Pointer() != nullptr) PrintAsReal(result.Value(), error);
}

constexpr PlainCommand kNumberConversions[] = {
    {{Code::ocinumberfromint, WordsBetween(5, 6), "OCINumberFromInt hError number num_length num_s_flag [result]"},
     RunFromInt},
    {{Code::ocinumberfromreal, WordsBetween(4, 5), "OCINumberFromReal hError number num_length [result]"}, RunFromReal},
    {{Code::ocinumberfromtext, WordsBetween(8, 9),
      "OCINumberFromText hError num num_len fmt fmt_len nls nls_len [result]"},
     RunFromText},
    {{Code::ocinumbertoint, WordsBetween(5, 6), "OCINumberToInt hError number datalen format [result]"}, RunToInt},
    {{Code::ocinumbertoreal, WordsBetween(4, 5), "OCINumberToReal hError number datalen [result]"}, RunToReal},
    {{Code::ocinumbertorealarray, WordsFrom(5), "OCINumberToRealArray hError elems datalen num1 num2 ... num_elems"},
     RunToRealArray},
    {{Code::ocinumbertotext, WordsBetween(8, 9), "OCINumberToText hError number fmt fmt_len nls nls_len bufsize [buf]"},
     RunToText},
};

}  // namespace

bool PrintAsReal(const OCINumber& value, OCIError* error) {
    double real = 0;
    const sword rc = Call(&ClientLibrary::OCINumberToReal, error, &value, uword{sizeof real}, &real);
    if (rc != OCI_SUCCESS) {
        ReturnCodeReport(error, rc);
        return false;
    }
    Message(kOutput, "%f\n", real);
    return true;
}

void AddNumberConversions(HandlerTable& handlers) {
    handlers.Add(kNumberConversions);
}
