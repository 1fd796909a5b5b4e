// Dates to and from text by a model: what depends on the day, on memory and on chance. Transcripts have the elements.
#include <gtest/gtest.h>

#include <random>

#include "date/format.h"
#include "date/zone.h"

namespace {

using namespace date;

// The text, or the error's number.
std::string Show(const DateTime& value, std::string_view model, const char* language) {
    char text[500];
    std::size_t length = 0;
    const Errno number = ToText(value, model, *FindLanguage(language), Scope::timestamp, text, sizeof text, &length);
    return number ? std::to_string(number) : std::string(text, length);
}

std::string Parse(std::string_view text, std::string_view model, const char* language) {
    DateTime value;
    const Errno number = FromText(text, model, *FindLanguage(language), Scope::timestamp, &value);
    if (number) return std::to_string(number);
    char engine_text[kMaxEngineText];
    return {engine_text, ToEngineText(value, engine_text)};
}

TEST(DateFromText, MissingFieldsAreOfToday) {
    DateTime now, value;
    ASSERT_EQ(Now(&now), 0);
    const int century = now.year - now.year % 100;
    const bool first_half = now.year % 100 < 50;    // RR: of the years with those digits the one that lies nearer
    const struct { const char *text, *model; int year, month, day; } cases[] = {
        {"13:14", "HH24:MI", now.year, now.month, 1}, {"02-03", "MM-DD", now.year, 2, 3},
        {"01-01-07", "DD-MM-YY", century + 7, 1, 1},
        {"7-01", "Y-MM", now.year - now.year % 10 + 7, 1, 1}, {"007-01", "YYY-MM", now.year - now.year % 1000 + 7, 1, 1},
        {"0412", "YYMM", century + 4, 12, 1},    // four digits, but a number follows
        {"01-01-49", "DD-MM-RR", century + 49 + (first_half ? 0 : 100), 1, 1},
        {"01-01-50", "DD-MM-RR", century + 50 - (first_half ? 100 : 0), 1, 1}};
    for (const auto& c : cases) {
        ASSERT_EQ(FromText(c.text, c.model, kEnglish, Scope::date, &value), 0) << c.text;
        EXPECT_EQ(value.year, c.year) << c.text;
        EXPECT_EQ(value.month, c.month) << c.text;
        EXPECT_EQ(value.day, c.day) << c.text;
    }
}

// What a model writes in full it reads back, exactly and not.
TEST(DateFromText, ReadsWhatWasWritten) {
    const char* models[] = {"SYYYY-MM-DD HH24:MI:SS.FF9", "J SSSSS FF9", "FXDD MONTH SYYYY HH24:MI:SSXFF9",
                            "FMDay, DD. Month SYYYY HH:MI:SS.FF9 AM", "DY DDD YYYY BC HH12-MI-SS FF9 P.M.",
                            "FXYYYY B.C. RM DAY DD SSSSS FF9"};
    std::mt19937 random(20240229);
    for (int i = 0; i < 3000; ++i) {
        DateTime value;
        FromDayNumber(std::uniform_int_distribution(366, 5373484)(random), &value);
        value.hour = static_cast<std::uint8_t>(random() % 24);
        value.minute = static_cast<std::uint8_t>(random() % 60);
        value.second = static_cast<std::uint8_t>(random() % 60);
        value.nanosecond = static_cast<std::uint32_t>(random() % 1'000'000'000);
        const char* model = models[i % std::size(models)];
        const char* language = i % 2 ? "german" : "french";
        char engine_text[kMaxEngineText];
        const std::string text = Show(value, model, language);
        EXPECT_EQ(Parse(text, model, language), std::string(engine_text, ToEngineText(value, engine_text)))
            << text << " | " << model;
    }
}

// Any bytes as text or model: an answer, and no harm.
TEST(DateFromText, SurvivesAnything) {
    constexpr std::string_view kPieces[] = {"YYYY", "MM", "DD", "J",  "\"", "FX", "FM", "-",   " ",    "MON", "12",
                                            "FF9",  "X",  "TZ", "TH", "SP", "é",  "AM", "RR", "\xC3", "DAY", "00"};
    std::mt19937 random(7);
    for (int i = 0; i < 20000; ++i) {
        std::string text, model;
        for (unsigned n = random() % 6; n > 0; --n) text += kPieces[random() % std::size(kPieces)];
        for (unsigned n = random() % 6; n > 0; --n) model += kPieces[random() % std::size(kPieces)];
        DateTime value;
        if (FromText(text, model, kEnglish, Scope::timestamp, &value) == 0) {
            EXPECT_EQ(Validate(value), 0) << text << " | " << model;
        }
    }
}

}  // namespace
