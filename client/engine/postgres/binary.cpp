// Numeric has digits of base 10000 with the weight of the first; a number has digits of base 100. Neither form is ever
// rounded on its way into the other, but for a numeric of more digits than a number can have.
#include "engine/postgres/binary.h"

#include <algorithm>
#include <chrono>
#include <limits>

#include "date/zone.h"
#include "handles/errors.h"
#include "number/decimal.h"
#include "number/digits.h"

namespace engine::postgres {
namespace {

constexpr std::uint16_t kPositive = 0;
constexpr std::uint16_t kNegative = 0x4000;
constexpr std::uint16_t kNotANumber = 0xC000;
constexpr std::uint16_t kPlusInfinity = 0xD000;
constexpr std::uint16_t kMinusInfinity = 0xF000;
constexpr std::size_t kHeader = 8;    // count of digits, weight, sign, scale
constexpr int kBase = 10000;

constexpr std::int64_t kSecond = 1'000'000;
constexpr std::int64_t kDay = 86400 * kSecond;
constexpr std::chrono::sys_days kEpoch = std::chrono::year(2000) / 1 / 1;

std::size_t PutHeader(std::uint16_t sign, char* bytes, int count = 0, int weight = 0, int scale = 0) {
    Put(static_cast<std::int16_t>(count), bytes);
    Put(static_cast<std::int16_t>(weight), bytes + 2);
    Put(sign, bytes + 4);
    Put(static_cast<std::int16_t>(scale), bytes + 6);
    return kHeader + 2 * static_cast<std::size_t>(count);
}

}  // namespace

std::size_t NumericFrom(const OCINumber& number, char* bytes) noexcept {
    number::Digits digits;
    if (number::Unpack(number, &digits) != 0) {
        if (!number::IsValid(number)) return 0;
        const bool negative = number.OCINumberPart[0] == 1;
        return PutHeader(negative ? kMinusInfinity : kPlusInfinity, bytes);
    }
    if (digits.IsZero()) return PutHeader(kPositive, bytes);
    const int pairs = static_cast<int>(number::CountDigits(digits));
    const int weight = digits.exponent >> 1;    // of the base below
    const int before = 2 * weight + 1 - digits.exponent;    // pairs of the first digit in front of the number's: 0 or 1
    const int count = (before + pairs + 1) / 2;
    const auto pair = [&](int index) {
        return index >= before && index - before < pairs ? number::DigitAt(digits, index - before) : std::uint8_t{0};
    };
    for (int index = 0; index < count; ++index) {
        const int digit = pair(2 * index) * 100 + pair(2 * index + 1);
        Put(static_cast<std::int16_t>(digit), bytes + kHeader + 2 * index);
    }
    const int last = digits.exponent - pairs + 1;    // the last pair's power of 100
    const int scale = last >= 0 ? 0 : -2 * last - (number::DigitAt(digits, pairs - 1) % 10 == 0);
    return PutHeader(digits.negative ? kNegative : kPositive, bytes, count, weight, scale);
}

int NumericTo(std::string_view bytes, NumericValue& value) noexcept {
    if (bytes.size() < kHeader) return errors::kInvalidNumber;
    const int count = Get<std::int16_t>(bytes.data());
    const int weight = Get<std::int16_t>(bytes.data() + 2);
    const auto sign = Get<std::uint16_t>(bytes.data() + 4);
    const char* const digits = bytes.data() + kHeader;
    if (sign == kNotANumber) return errors::kInvalidNumber;
    if (sign == kPlusInfinity || sign == kMinusInfinity) return errors::kNumericOverflow;
    if (count < 0 || bytes.size() < kHeader + 2 * static_cast<std::size_t>(count)) return errors::kInvalidNumber;
    value.is_integer = count <= weight + 1 && weight < 4;    // below 10^16
    if (value.is_integer) {
        for (int index = 0; index <= weight; ++index) {
            value.integer = value.integer * kBase + (index < count ? Get<std::int16_t>(digits + 2 * index) : 0);
        }
        if (sign == kNegative) value.integer = -value.integer;
        return 0;
    }
    char text[96];    // more digits than a number has, with what decides how the last one is rounded
    const int used = std::min(count, static_cast<int>(sizeof text) / 4);
    for (int index = 0; index < used; ++index) {
        auto digit = static_cast<unsigned>(Get<std::int16_t>(digits + 2 * index));
        for (int place = 3; place >= 0; --place, digit /= 10) text[4 * index + place] = static_cast<char>('0' + digit % 10);
    }
    const int error = number::FromDecimal({text, static_cast<std::size_t>(4 * used)}, 4 * (weight + 1),
                                          sign == kNegative, &value.number);
    if (error == errors::kNumberOverflow) return errors::kNumericOverflow;
    if (error == 0) return 0;
    number::SetZero(&value.number);    // too small to hold
    return 0;
}

// ---- Times

int DaysTo(std::int32_t days, date::DateTime& value) noexcept {
    constexpr std::chrono::sys_days kFirst = std::chrono::year(date::kMinYear + 1) / 1 / 1;    // 1 BC is the year 0 there
    constexpr std::chrono::sys_days kLast = std::chrono::year(date::kMaxYear) / 12 / 31;
    if (days < (kFirst - kEpoch).count() || days > (kLast - kEpoch).count()) return errors::kBadYear;
    const std::chrono::year_month_day date(kEpoch + std::chrono::days(days));
    const int year = static_cast<int>(date.year());
    value.year = static_cast<std::int16_t>(year > 0 ? year : year - 1);
    value.month = static_cast<std::uint8_t>(static_cast<unsigned>(date.month()));
    value.day = static_cast<std::uint8_t>(static_cast<unsigned>(date.day()));
    return 0;
}

int MicrosecondsTo(std::int64_t microseconds, date::DateTime& value) noexcept {
    value = {};
    std::int64_t days = microseconds / kDay;
    std::int64_t rest = microseconds % kDay;
    if (rest < 0) {
        rest += kDay;
        --days;
    }
    value.nanosecond = static_cast<std::uint32_t>(rest % kSecond * 1000);
    rest /= kSecond;
    value.second = static_cast<std::uint8_t>(rest % 60);
    value.minute = static_cast<std::uint8_t>(rest / 60 % 60);
    value.hour = static_cast<std::uint8_t>(rest / 3600);
    return DaysTo(static_cast<std::int32_t>(days), value);
}

int MicrosecondsFrom(const date::DateTime& given, std::int64_t& microseconds) noexcept {
    date::DateTime value = given;
    if (given.month == 0) return errors::kBadMonth;    // a time alone
    if (const int error = date::RoundFraction(given, 6, &value)) return error;
    const int year = value.year > 0 ? value.year : value.year + 1;
    const std::chrono::year_month_day date(std::chrono::year(year), std::chrono::month(value.month),
                                           std::chrono::day(value.day));
    if (!date.ok()) return errors::kBadDayForMonth;
    const std::int64_t days = (std::chrono::sys_days(date) - kEpoch).count();
    microseconds = days * kDay + ((value.hour * 60 + value.minute) * 60 + value.second) * kSecond +
                   value.nanosecond / 1000;
    return 0;
}

int MomentFrom(const date::DateTime& value, std::int64_t& microseconds) noexcept {
    date::DateTime zoned = value;
    if (!zoned.has_zone) {
        if (const int error = date::SetZone({}, &zoned)) return error;
    }
    if (const int error = MicrosecondsFrom(zoned, microseconds)) return error;
    microseconds -= zoned.zone_minutes * 60 * kSecond;
    return 0;
}

int MomentTo(std::int64_t microseconds, date::DateTime& value) noexcept {
    if (const int error = MicrosecondsTo(microseconds, value)) return error;
    value.has_zone = true;
    return date::ToLocal(value, &value);
}

// ---- Row ids

RowId RowIdOf(const char* tuple_id) noexcept {
    RowId row;
    std::memcpy(row.bytes.data() + row.bytes.size() - kTupleIdSize, tuple_id, kTupleIdSize);
    return row;
}

void TupleIdOf(const RowId& row, char* tuple_id) noexcept {
    std::memcpy(tuple_id, row.bytes.data() + row.bytes.size() - kTupleIdSize, kTupleIdSize);
}

}  // namespace engine::postgres
