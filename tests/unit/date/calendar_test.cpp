// The calendar, day by day; what is done with it stands in transcripts.
#include <gtest/gtest.h>

#include "date/date.h"

namespace {

using namespace date;

DateTime Day(int year, int month, int day) {
    return {.year = static_cast<std::int16_t>(year),
            .month = static_cast<std::uint8_t>(month),
            .day = static_cast<std::uint8_t>(day)};
}

TEST(Calendar, CountsEveryDayOnce) {
    DateTime day = Day(-4712, 1, 1), next;
    int wrong = 0;
    for (DayNumber number = 366; number < 5373484; ++number, day = next) {
        FromDayNumber(number + 1, &next);
        const bool same_month = next.month == day.month && next.day > day.day;
        const bool next_month = next.day == 1 && (next.month == day.month % 12 + 1);
        wrong += ToDayNumber(day) != number || ValidateDate(day) != 0 || !(same_month || next_month);
    }
    EXPECT_EQ(wrong, 0);
    EXPECT_EQ(day, Day(9999, 12, 31));
}

}  // namespace
