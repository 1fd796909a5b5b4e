// Numbers to and from the three forms in which they lie in a file.
#include "engine/sqlite/stored_number.h"

#include <cstring>

#include "number/number.h"

namespace engine::sqlite {
namespace {

constexpr unsigned char kMark[4] = {0x00, 'N', 0xC0, 0x80};

// Significant decimal digits of a well-formed number that is not zero.
int SignificantDigits(const OCINumber& number) {
    const auto* bytes = number.OCINumberPart;
    const bool positive = bytes[1] & 0x80;
    int count = bytes[0] - 1;
    if (!positive && bytes[bytes[0]] == 102) --count;
    const auto digit = [&](int index) { return positive ? bytes[2 + index] - 1 : 101 - bytes[2 + index]; };
    int digits = 2 * count;
    if (digit(0) < 10) --digits;
    if (digit(count - 1) % 10 == 0) --digits;
    return digits;
}

}  // namespace

StoredNumber StoredNumber::From(const OCINumber& number) {
    StoredNumber stored;
    if (!number::IsValid(number)) return stored;
    int whole = 0;
    if (number::IsInt(number, &whole) == 0 && whole && number::ToInt64(number, &stored.integer) == 0) {
        stored.form = Form::integer;
    } else if (SignificantDigits(number) <= number::kRealDigits && number::ToDouble(number, &stored.real) == 0) {
        stored.form = Form::real;
    } else {
        return Blob(number);
    }
    return stored;
}

StoredNumber StoredNumber::Blob(const OCINumber& number) {
    StoredNumber stored;
    stored.form = Form::blob;
    const std::size_t count = number.OCINumberPart[0];
    std::memcpy(stored.blob, kMark, sizeof kMark);
    std::memcpy(stored.blob + sizeof kMark, number.OCINumberPart + 1, count);
    stored.length = static_cast<std::uint8_t>(sizeof kMark + count);
    return stored;
}

bool ReadNumberBlob(std::string_view blob, OCINumber& number) {
    if (blob.size() <= sizeof kMark || blob.size() > sizeof kMark + OCI_NUMBER_SIZE - 1) return false;
    if (std::memcmp(blob.data(), kMark, sizeof kMark) != 0) return false;
    number = {};
    const std::size_t count = blob.size() - sizeof kMark;
    number.OCINumberPart[0] = static_cast<unsigned char>(count);
    std::memcpy(number.OCINumberPart + 1, blob.data() + sizeof kMark, count);
    return number::IsValid(number);
}

}  // namespace engine::sqlite
