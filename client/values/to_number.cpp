// Engine values as numbers: 22-byte numbers, packed decimals, decimal floats, integers and reals of each width.
#include <cmath>
#include <limits>

#include "handles/errors.h"
#include "number/decimal_float.h"
#include "number/number.h"
#include "oci.h"
#include "values/out_rows.h"
#include "values/packed_decimal.h"

namespace values {
namespace {

using engine::Datum;

int NumberOfInteger(const Datum& datum, Workspace&, OCINumber& number) {
    number::FromInt64(datum.integer, &number);
    return 0;
}
int NumberOfReal(const Datum& datum, Workspace&, OCINumber& number) {
    return AsConversionError(number::FromReal15(datum.real, &number));
}
int NumberOfBinaryReal(const Datum& datum, Workspace&, OCINumber& number) {
    return AsConversionError(number::FromDouble(datum.real, &number));
}
int NumberOfSingleReal(const Datum& datum, Workspace&, OCINumber& number) {
    return AsConversionError(number::FromDouble(SingleByDigits(datum.real), &number));
}
int OwnNumber(const Datum& datum, Workspace&, OCINumber& number) {
    std::memcpy(&number, datum.data, sizeof number);
    return 0;
}
int NumberOfText(const Datum& datum, Workspace&, OCINumber& number) {
    return AsConversionError(number::FromPlainText(datum.Text(), '.', &number));
}

int PutBytes(const void* bytes, std::uint32_t size, Target& target) {
    std::memcpy(target.at, bytes, size);
    target.stored = size;
    return 0;
}

int PutNum(const OCINumber& number, Workspace&, Target& target) { return PutBytes(&number, sizeof number, target); }

int PutPdn(const OCINumber& number, Workspace& workspace, Target& target) {
    target.stored = target.size;
    return ToPackedDecimal(number, workspace.precision, workspace.scale, target.at, target.size);
}

template <std::uint32_t size>
int PutDecimal(const OCINumber& number, Workspace&, Target& target) {
    char bytes[size];
    if (const int error = AsConversionError(number::ToDecimalFloat(number, size, bytes))) return error;
    return PutBytes(bytes, size, target);
}

// A 64-bit value in as many bytes as the area has; 1455 when it does not fit.
template <class Wide, class Narrow>
int PutNarrow(Wide value, Target& target) {
    const auto narrow = static_cast<Narrow>(value);
    if (static_cast<Wide>(narrow) != value) return errors::kIntegerOverflow;
    return PutBytes(&narrow, sizeof narrow, target);
}
int PutInt(std::int64_t value, Workspace&, Target& target) {
    switch (target.size) {
        case 1: return PutNarrow<std::int64_t, std::int8_t>(value, target);
        case 2: return PutNarrow<std::int64_t, std::int16_t>(value, target);
        case 4: return PutNarrow<std::int64_t, std::int32_t>(value, target);
        default: return PutBytes(&value, sizeof value, target);
    }
}
int PutUin(std::uint64_t value, Workspace&, Target& target) {
    switch (target.size) {
        case 1: return PutNarrow<std::uint64_t, std::uint8_t>(value, target);
        case 2: return PutNarrow<std::uint64_t, std::uint16_t>(value, target);
        case 4: return PutNarrow<std::uint64_t, std::uint32_t>(value, target);
        default: return PutBytes(&value, sizeof value, target);
    }
}

int IntOfInteger(const Datum& datum, Workspace&, std::int64_t& value) {
    value = datum.integer;
    return 0;
}
int UintOfInteger(const Datum& datum, Workspace&, std::uint64_t& value) {
    value = static_cast<std::uint64_t>(datum.integer);
    return datum.integer < 0 ? errors::kIntegerOverflow : 0;
}
// The fraction is cut. The upper limit is the power of two above, which a double holds exactly.
template <class Integer>
int IntegerOfBinaryReal(const Datum& datum, Workspace&, Integer& value) {
    const double whole = std::trunc(datum.real);
    constexpr double kEnd = std::numeric_limits<Integer>::digits == 64 ? 18446744073709551616.0 : 9223372036854775808.0;
    if (!(whole >= static_cast<double>(std::numeric_limits<Integer>::min()) && whole < kEnd))
        return errors::kIntegerOverflow;
    value = static_cast<Integer>(whole);
    return 0;
}
int ToInteger(const OCINumber& number, std::int64_t& value) { return number::ToInt64(number, &value); }
int ToInteger(const OCINumber& number, std::uint64_t& value) { return number::ToUint64(number, &value); }
template <class Integer, auto render>
int IntegerOfNumber(const Datum& datum, Workspace& workspace, Integer& value) {
    OCINumber number;
    if (const int error = render(datum, workspace, number)) return error;
    return ToInteger(number, value) != 0 ? errors::kIntegerOverflow : 0;
}

// What is a whole number but for the engine's binary arithmetic, is one: 4.35 * 100 is 435. What engines compute beyond
// 64 bits may be rounded to the lower end, which by itself is an integer to them.
template <class Integer>
int IntegerOfReal(const Datum& datum, Workspace& workspace, Integer& value) {
    constexpr double kLowest = -9223372036854775808.0;
    if (datum.real <= kLowest) return errors::kIntegerOverflow;
    if (std::trunc(datum.real) == datum.real) return IntegerOfBinaryReal(datum, workspace, value);
    return IntegerOfNumber<Integer, NumberOfReal>(datum, workspace, value);
}

int RealOfInteger(const Datum& datum, Workspace&, double& value) {
    value = static_cast<double>(datum.integer);
    return 0;
}
int OwnReal(const Datum& datum, Workspace&, double& value) {
    value = datum.real;
    return 0;
}
template <auto render>
int RealOfNumber(const Datum& datum, Workspace& workspace, double& value) {
    OCINumber number;
    if (const int error = render(datum, workspace, number)) return error;
    return AsConversionError(number::ToDouble(number, &value));
}
// Four bytes are a float; from eight on the area begins with a double.
int PutFlt(double value, Workspace&, Target& target) {
    if (target.size >= sizeof value) return PutBytes(&value, sizeof value, target);
    const auto narrow = static_cast<float>(value);
    if (std::isinf(narrow) && !std::isinf(value)) return errors::kNumericOverflow;
    return PutBytes(&narrow, sizeof narrow, target);
}

template <class Form, auto put, auto integer, auto real, auto decimal, auto text, auto binary_real,
          auto single_real>
constexpr ByOrigin<OutConverter> kRow = {
    NoConversion, Through<Form, integer, put>, Through<Form, real, put>, Through<Form, decimal, put>,
    Through<Form, text, put>, NoConversion, NoConversion, NoConversion, NoConversion, NoConversion,
    Through<Form, text, put>, Through<Form, binary_real, put>, Through<Form, single_real, put>, NoConversion};

template <auto put>
constexpr ByOrigin<OutConverter> kNumberRow =
    kRow<OCINumber, put, NumberOfInteger, NumberOfReal, OwnNumber, NumberOfText, NumberOfBinaryReal,
         NumberOfSingleReal>;

template <class Integer, auto put, auto integer>
constexpr ByOrigin<OutConverter> kIntegerRow =
    kRow<Integer, put, integer, IntegerOfReal<Integer>, IntegerOfNumber<Integer, OwnNumber>,
         IntegerOfNumber<Integer, NumberOfText>, IntegerOfBinaryReal<Integer>, IntegerOfBinaryReal<Integer>>;

}  // namespace

double SingleByDigits(double value) {
    const auto single = static_cast<float>(value);
    return static_cast<double>(single) == value ? number::WidenByDigits(single) : value;
}

int AsConversionError(int error) {
    switch (error) {
        case 0: return 0;
        case errors::kNumberOverflow:
        case errors::kNumberUnderflow:
        case errors::kNumericOverflow: return errors::kNumericOverflow;
        default: return errors::kInvalidNumber;
    }
}

const ByOrigin<OutConverter> kToNum = kNumberRow<PutNum>;
const ByOrigin<OutConverter> kToPdn = kNumberRow<PutPdn>;
const ByOrigin<OutConverter> kToDecimal64 = kNumberRow<PutDecimal<number::kDecimal64Size>>;
const ByOrigin<OutConverter> kToDecimal128 = kNumberRow<PutDecimal<number::kDecimal128Size>>;
const ByOrigin<OutConverter> kToInt = kIntegerRow<std::int64_t, PutInt, IntOfInteger>;
const ByOrigin<OutConverter> kToUin = kIntegerRow<std::uint64_t, PutUin, UintOfInteger>;
const ByOrigin<OutConverter> kToFlt =
    kRow<double, PutFlt, RealOfInteger, OwnReal, RealOfNumber<OwnNumber>, RealOfNumber<NumberOfText>, OwnReal,
         OwnReal>;

}  // namespace values
