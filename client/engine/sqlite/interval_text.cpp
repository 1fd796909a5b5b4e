// Months, or nanoseconds, and back.
#include "engine/sqlite/interval_text.h"

#include "oci.h"

namespace engine::sqlite {
namespace {

constexpr std::int64_t kSecond = 1000000000;

}  // namespace

bool KeepInterval(const date::Interval& interval, std::int64_t& kept) {
    kept = interval.whole;
    if (interval.span == date::Span::year_month) return true;
    return !__builtin_mul_overflow(interval.whole, kSecond, &kept) &&
           !__builtin_add_overflow(kept, std::int64_t{interval.nanosecond}, &kept);
}

std::string_view WriteInterval(std::int64_t kept, const Column& column, IntervalText& text) {
    const bool of_months = column.type == SQLT_INTERVAL_YM;
    date::Interval interval{date::Span::year_month, kept, 0};
    if (!of_months) interval = {date::Span::day_second, kept / kSecond, static_cast<std::int32_t>(kept % kSecond)};
    const auto fraction = static_cast<unsigned>(of_months ? 0 : column.scale);
    std::size_t length = 0;
    if (date::ToText(interval, column.precision, fraction, text.data(), &length) != 0 &&
        date::ToText(interval, 9, 9, text.data(), &length) != 0)
        return {};
    return {text.data(), length};
}

}  // namespace engine::sqlite
