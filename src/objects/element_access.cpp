// The 7-byte date and the date literal.
#include "objects/element_access.h"

#include <cctype>
#include <cstdlib>
#include <iterator>

namespace {

constexpr size_t kSevenBytes = 7;

bool IsLeapYear(int year) {
    if (year < 0) ++year;  // there is no year 0
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

int DaysOfMonth(int year, int month) {
    constexpr int kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return month == 2 && IsLeapYear(year) ? 29 : kDays[month - 1];
}

}  // namespace

bool SevenByteDate::Read(const unsigned char* data, size_t size) {
    if (size < kSevenBytes) return false;
    year = (data[0] - 100) * 100 + data[1] - 100;
    month = data[2];
    day = data[3];
    hour = data[4] - 1;
    minute = data[5] - 1;
    second = data[6] - 1;
    return Possible();
}

bool SevenByteDate::Possible() const {
    if (year < -4712 || year > 9999 || year == 0 || month < 1 || month > 12) return false;
    if (day < 1 || day > DaysOfMonth(year, month)) return false;
    return hour >= 0 && hour < 24 && minute >= 0 && minute < 60 && second >= 0 && second < 60;
}

void SevenByteDate::Write(unsigned char* data, size_t size) const {
    const int bytes[kSevenBytes] = {year / 100 + 100, year % 100 + 100, month, day, hour + 1, minute + 1, second + 1};
    for (size_t index = 0; index < std::min(size, kSevenBytes); ++index)
        data[index] = static_cast<unsigned char>(bytes[index]);
}

bool ReadDateLiteral(const char* text, SevenByteDate& date) {
    if (std::isdigit(static_cast<unsigned char>(*text)) == 0) return false;
    struct Field {
        int SevenByteDate::*member;
        char separator;  // that must stand before it
    };
    constexpr Field kFields[] = {{&SevenByteDate::month, '-'}, {&SevenByteDate::day, '-'}, {&SevenByteDate::hour, '-'},
                                 {&SevenByteDate::minute, ':'}, {&SevenByteDate::second, ':'}};
    date = {};
    date.year = std::atoi(text);
    for (const Field& field : kFields) {
        text = std::strchr(text, field.separator);
        if (text == nullptr) return true;
        date.*field.member = std::atoi(++text);
    }
    return true;
}
