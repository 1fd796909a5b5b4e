// Dates to and from text by a model.
#include <gtest/gtest.h>

#include <random>

#include "date/format.h"
#include "date/zone.h"
#include "reading.h"

namespace {

using namespace date;

// The text, or the error's number.
std::string Show(const DateTime& value, std::string_view model, const char* language = "english",
                 Scope scope = Scope::timestamp) {
    char text[500];
    std::size_t length = 0;
    const Errno number = ToText(value, model, *FindLanguage(language), scope, text, sizeof text, &length);
    return number ? std::to_string(number) : std::string(text, length);
}

std::string Parse(std::string_view text, std::string_view model, const char* language = "english",
                  Scope scope = Scope::timestamp) {
    DateTime value;
    const Errno number = FromText(text, model, *FindLanguage(language), scope, &value);
    if (number) return std::to_string(number);
    char engine_text[kMaxEngineText];
    return {engine_text, ToEngineText(value, engine_text)};
}

TEST(DateToText, EachElement) {
    const struct { const char* value; const char* model; const char* text; } cases[] = {
        {"2024-02-09", "YYYY YYY YY Y RRRR RR", "2024 024 24 4 2024 24"}, {"2024-02-09", "SYYYY Y,YYY", " 2024 2,024"},
        {"-0044-03-15", "SYYYY YYYY BC B.C. ad A.d. IYYY", "-0044 0044 BC B.C. bc B.c. 0044"},
        {"0987-01-01", "Y,YYY FMY,YYY YYYY", "0,987 0,987 987"},
        {"2024-02-09", "YEAR Year year", "TWENTY TWENTY-FOUR Twenty Twenty-Four twenty twenty-four"},
        {"1900-02-09", "YEAR", "NINETEEN HUNDRED"}, {"2005-02-09", "Year", "Two Thousand Five"},
        {"-0753-04-21", "SYEAR", "-SEVEN FIFTY-THREE"}, {"2000-04-09", "CC SCC Q", "20  20 2"},
        {"2001-12-09", "CC FMSCC Q", "21 21 4"}, {"-0001-12-09", "SCC", "-01"},
        {"9901-12-09", "CC CCTH FMYYY", "100 100TH 901"}, {"2024-02-09", "MM MON Mon mon RM|", "02 FEB Feb feb II  |"},
        {"2024-05-09", "MONTH|Month|month|fmMonth|", "MAY      |May      |may      |May|"},
        {"2024-09-04", "DAY Day day fmDay DY Dy dy D", "WEDNESDAY Wednesday wednesday Wednesday WED Wed wed 4"},
        {"2024-09-01", "DAY|D", "SUNDAY   |1"},
        {"2024-12-30", "DDD DD WW W IW IYYY IYY IY I", "365 30 53 5 01 2025 025 25 5"},
        {"2021-01-03", "DDD WW W IW IYYY", "003 01 1 53 2020"}, {"1582-10-15", "DDD J", "278 2299161"}, {"2021-01-07", "WW W", "01 1"}, {"2021-01-08", "WW W", "02 2"}, {"2026-01-08", "IW", "02"},
        {"-4712-01-01", "J", "0000001"}, {"9999-12-31", "J", "5373484"},
        {"2024-02-09 00:05:09", "HH HH12 HH24 MI SS SSSSS AM", "12 12 00 05 09 00309 AM"},
        {"2024-02-09 12:05:09", "HH HH24 PM P.M. a.m. Am", "12 12 PM P.M. p.m. Pm"},
        {"2024-02-09 23:59:59", "FMHH:MI:SS SSSSS a.m.", "11:59:59 86399 p.m."},
        {"2024-02-09", "DDTH Ddth ddth DDSP DDSPTH Ddspth ddthsp", "09TH 09th 09th NINE NINTH Ninth ninth"},
        {"2024-02-21", "FMDDTH DDSPTH D DSP MMSPTH", "21ST TWENTY-FIRST 4 FOUR SECOND"},
        {"2024-02-11", "DDTH FMMITH MISP", "11TH 0TH ZERO"}, {"2024-02-12", "DDspth", "TWELFTH"},
        {"2024-04-20", "DDDTH DDDspth", "111TH ONE HUNDRED ELEVENTH"}, {"2024-04-21", "DDDTH", "112TH"},
        {"2024-04-09", "DDDsp", "ONE HUNDRED"}, {"2024-04-10", "DDDsp", "ONE HUNDRED ONE"}, {"0099-01-01", "Year", "Ninety-Nine"},
        {"2025-11-20", "Jsp", "Two Million Four Hundred Sixty-One Thousand"}, {"2023-02-25", "Jsp", "Two Million Four Hundred Sixty Thousand One"},
        {"2024-04-30", "DDDTH", "121ST"}, {"2024-07-29", "DDDTH", "211TH"}, {"2024-02-20", "DDspth", "TWENTIETH"},
        {"2024-02-29", "Jsp", "Two Million Four Hundred Sixty Thousand Three Hundred Seventy"},
        {"2024-02-09 01:02:03.123456", "SSXFF FF1 FF3 FF6 FF9", "03.123456 1 123 123456 123456000"},
        {"2024-02-09 01:02:03.123456789", "FF FF2", "123456789 12"},
        {"2024-02-09 01:02:03 -03:30", "TZH:TZM TZR", "-03:30 -03:30"},
        {"2024-02-09 01:02:03 -00:30", "TZH:TZM YYSP", "-00:30 TWENTY-FOUR"},
        {"2024-02-09", "\"Day\" DD \"of\" fmMonth, yyyy/mm-dd;.:", "Day 09 of February, 2024/2-9;.:"},
        {"2024-02-09", "DL|DS|TS", "Friday, February 9, 2024|2/9/2024|12:00:00 AM"},
        {"2024-02-09", "DS DD", "2/9/2024 09"}, {"2024-02-09", "", ""},
    };
    for (const auto& c : cases) EXPECT_EQ(Show(Read(c.value), c.model), c.text) << c.value << ' ' << c.model;
}

TEST(DateToText, Languages) {
    const struct { const char* language; const char* model; const char* text; } cases[] = {
        {"german", "FMDay, DD. Month YYYY", "Samstag, 9. März 2024"},
        {"GERMAN_AUSTRIA", "DY MON|DAY|MONTH|", "SA MRZ|SAMSTAG   |MÄRZ     |"},
        {"french", "Day|DY|MON|", "Samedi  |SAM.|MARS |"}, {"French", "DL", "samedi 9 mars 2024"},
        {"spanish", "fmDAY|Dy", "SÁBADO|Sáb"}, {"italian", "fmDay DD month", "Sabato 9 marzo"},
        {"American", "fmDay", "Saturday"}};
    for (const auto& c : cases) EXPECT_EQ(Show(Read("2024-03-09"), c.model, c.language), c.text) << c.language;
    EXPECT_EQ(FindLanguage("klingon"), nullptr);
    EXPECT_EQ(FindLanguage(""), nullptr);
}

TEST(DateToText, ModelsThatAreRefused) {
    for (const char* model : {"YYYZ", "\"open", "é", "FF0", "Z", "\x01", "DD\tMM", "DDSPSP", "DDTHTH"})
        EXPECT_EQ(Show(Read("2024-03-09"), model), "1821") << model;
    for (const char* model : {"FF", "X", "TZH", "TZM", "TZR", "TZD", "FF3"})
        EXPECT_EQ(Show(Read("2024-03-09"), model, "english", Scope::date), "1821") << model;
}

TEST(DateToText, SaysHowMuchRoomItTakes) {
    char text[9] = "????????";
    std::size_t length = 0;
    const DateTime value = Read("2024-03-09");
    EXPECT_EQ(ToText(value, "YYYY-MM-DD", kEnglish, Scope::date, text, 4, &length), 22059);
    EXPECT_EQ(length, 10u);
    EXPECT_STREQ(text, "2024????");
    EXPECT_EQ(ToText(value, "YYYYMMDD", kEnglish, Scope::date, text, 8, &length), 0);
    EXPECT_STREQ(text, "20240309");
}

TEST(DateFromText, Reads) {
    const struct { const char* text; const char* model; const char* value; } cases[] = {
        {"2024-02-29", "YYYY-MM-DD", "2024-02-29 00:00:00"},
        {"20240229130509", "YYYYMMDDHH24MISS", "2024-02-29 13:05:09"},
        {"20240229", "YYYY-MM-DD", "2024-02-29 00:00:00"}, {" 2024 / 2 . 9 ", "YYYY-MM-DD", "2024-02-09 00:00:00"},
        {"29FEB2024", "DD-MON-YYYY", "2024-02-29 00:00:00"}, {"29-february-2024", "DD-MON-YYYY", "2024-02-29 00:00:00"},
        {"29 Feb 2024", "DD MONTH YYYY", "2024-02-29 00:00:00"}, {"29-may-2024", "DD-MM-YYYY", "2024-05-29 00:00:00"},
        {"9-XII-1999", "DD-RM-YYYY", "1999-12-09 00:00:00"}, {"2024-060", "YYYY-DDD", "2024-02-29 00:00:00"},
        {"1582-278", "YYYY-DDD", "1582-10-15 00:00:00"}, {"2460370", "J", "2024-02-29 00:00:00"},
        {"1", "J", "-4712-01-01 00:00:00"}, {"1721424", "J", "0001-01-01 00:00:00"},
        {"1721058", "J", "-0001-12-31 00:00:00"}, {"-44-03-15", "SYYYY-MM-DD", "-0044-03-15 00:00:00"},
        {"15.03.44 b.c.", "DD.MM.YYYY AD", "-0044-03-15 00:00:00"},
        {"2,024-02-01", "Y,YYY-MM-DD", "2024-02-01 00:00:00"},
        {"01-01-2024 12:00 am", "DD-MM-YYYY HH:MI PM", "2024-01-01 00:00:00"},
        {"01-01-2024 12:30 p.m.", "DD-MM-YYYY HH:MI A.M.", "2024-01-01 12:30:00"},
        {"pm 01-01-2024 11", "AM DD-MM-YYYY HH", "2024-01-01 23:00:00"},
        {"01-01-2024 86399", "DD-MM-YYYY SSSSS", "2024-01-01 23:59:59"},
        {"01-01-2024", "DD-MM-YYYY HH24:MI:SS", "2024-01-01 00:00:00"},
        {"01-01-2024 7", "DD-MM-YYYY HH24:MI:SS", "2024-01-01 07:00:00"},
        {"THURSDAY 29-02-2024", "DAY DD-MM-YYYY", "2024-02-29 00:00:00"},
        {"Thu 5 29-02-2024", "DY \"5\" DD-MM-YYYY", "2024-02-29 00:00:00"},
        {"day29of2024-02", "\"Day\"DD\"of\"YYYY-MM", "2024-02-29 00:00:00"},
        {"1-2-3.25", "YYYY-MM-DDXFF", "0001-02-03 00:00:00.25"},
        {"01-JAN-24 10.00.00.123456789 PM", "DD-MON-RR HH.MI.SSXFF AM", "2024-01-01 22:00:00.123456789"},
        {"01-JAN-24 10.00.00 PM", "DD-MON-RR HH.MI.SSXFF AM", "2024-01-01 22:00:00"},
        {"2024-01-01 10:00:00 -05:30", "YYYY-MM-DD HH24:MI:SS TZH:TZM", "2024-01-01 10:00:00 -05:30"},
        {"2024-01-01 10:00:00+5", "YYYY-MM-DD HH24:MI:SS TZH:TZM", "2024-01-01 10:00:00 +05:00"},
        {"2024-07-01 10:00 Europe/Paris CEST", "YYYY-MM-DD HH24:MI TZR TZD", "2024-07-01 10:00:00 +02:00"},
        {"2024-02-09", "FXYYYY-MM-DD", "2024-02-09 00:00:00"}, {"2024-2-9", "FXFMYYYY-MM-DD", "2024-02-09 00:00:00"},
        {"May       09, 1999", "FXMonth DD, YYYY", "1999-05-09 00:00:00"},
        {"1999 MAY      ", "FXYYYY MONTH", "1999-05-01 00:00:00"},
        {"1999-05-09  ", "FXYYYY-FXMM-DD", "1999-05-09 00:00:00"}, {"01-JAN-2031", "DD-MON-RR", "2031-01-01 00:00:00"},
        // Four digits for a short year: just four, and no number behind.
        {"1404-05", "YY-MM", "1404-05-01 00:00:00"}, {"MAY1404", "MONYY", "1404-05-01 00:00:00"},
        {"1404-05", "YYY-MM", "1404-05-01 00:00:00"}, {"4-01-02", "YY-MM-DD", "2004-01-02 00:00:00"},
        {"024-01-02", "RRRR-MM-DD", "0024-01-02 00:00:00"},
        // What stands in the place of a mark: a sign of what follows, the mark itself, blanks.
        {"15.03-44", "DD.MM.SYYYY", "-0044-03-15 00:00:00"}, {"15-03-44", "DD-MM-SYYYY", "0044-03-15 00:00:00"},
        {"+44-03-15", "SYYYY-MM-DD", "0044-03-15 00:00:00"},
        {"2024-01-01 10-05:30", "YYYY-MM-DD HH24 TZH:TZM", "2024-01-01 10:00:00 -05:30"},
        {"2024-01-01 10-05:30", "YYYY-MM-DD HH24 TZR", "2024-01-01 10:00:00 -05:30"},
        {"2024-01-01 10+05:30", "YYYY-MM-DD HH24,TZR", "2024-01-01 10:00:00 +05:30"},
        {"2024-01-01 10,+05:30", "YYYY-MM-DD HH24 TZH:TZM", "2024-01-01 10:00:00 +05:30"},
        {"2024-1-1 1:02:035", "YYYY-MM-DD HH24:MI:SS.FF", "2024-01-01 01:02:03.5"},
        {"2024 of 02", "YYYY\"of\"MM", "2024-02-01 00:00:00"}, {"1-2-3.5", "YYYY-MM-DDXFF3", "0001-02-03 00:00:00.5"},
        {"2024-02-29 01.5", "FXYYYY-MM-DD SSXFF", "2024-02-29 00:00:01.5"},
        {"202402295", "YYYYMMDD-\"5\"", "2024-02-29 00:00:00"},
        {"2024-02-29 3661 01:01:01", "YYYY-MM-DD SSSSS HH24:MI:SS", "2024-02-29 01:01:01"},
        {"29 may 2024", "DD-MM-YYYY", "2024-05-29 00:00:00"}, {"May of 2024", "MONTH\" of \"YYYY", "2024-05-01 00:00:00"},
        {"May 2024", "FXFMMonth YYYY", "2024-05-01 00:00:00"}, {"1-2-3,25", "YYYY-MM-DDXFF", "0001-02-03 00:00:00.25"},
        {"2024-1-1 1.5", "FXFMYYYY-MM-DD SSXFF3", "2024-01-01 00:00:01.5"},
        {"01-01-2024 10", "DD-MM-YYYY HH AM", "2024-01-01 10:00:00"},
        {"2024-366", "YYYY-DDD", "2024-12-31 00:00:00"}, {"5373484", "J", "9999-12-31 00:00:00"},
    };
    for (const auto& c : cases) EXPECT_EQ(Parse(c.text, c.model), c.value) << c.text << ' ' << c.model;
    EXPECT_EQ(Parse("9. märz 2024", "DD. MONTH YYYY", "german"), "2024-03-09 00:00:00");
    EXPECT_EQ(Parse("9 DÉC. 2024", "DD MON YYYY", "french"), "2024-12-09 00:00:00");
}

TEST(DateFromText, Refuses) {
    const struct { const char* text; const char* model; Errno number; } cases[] = {
        {"2024-13-01", "YYYY-MM-DD", 1843}, {"2024-00-01", "YYYY-MM-DD", 1843}, {"01-FOO-24", "DD-MON-RR", 1843},
        {"01-02-24", "DD-MON-RR", 1843}, {"2023-02-29", "YYYY-MM-DD", 1839}, {"2024-01-32", "YYYY-MM-DD", 1847},
        {"2024-01-00", "YYYY-MM-DD", 1847}, {"0000-01-01", "YYYY-MM-DD", 1841}, {"-4713-01-01", "SYYYY-MM-DD", 1841},
        {"1582-10-05", "YYYY-MM-DD", 1864}, {"2023-366", "YYYY-DDD", 1848}, {"2023-367", "YYYY-DDD", 1848},
        {"0", "J", 1854}, {"5373485", "J", 1854}, {"1721200", "J", 1864}, {"13 AM", "HH AM", 1849},
        {"0 AM", "HH12 AM", 1849}, {"24", "HH24", 1850}, {"60", "MI", 1851}, {"60", "SS", 1852},
        {"86400", "SSSSS", 1853}, {"8", "D", 1846}, {"FUNDAY", "DAY", 1846}, {"FUN", "DY", 1846}, {"Q", "RM", 1843}, {"10 XM", "HH AM", 1855},
        {"10 44 XX", "HH YYYY BC", 1856}, {"a024", "YYYY", 1858}, {"123", "DAY", 1859}, {"10 1", "HH AM", 1859},
        {"2012-01-05", "DD-MON-RR", 1861}, {"2024x02", "YYYY-MM", 1861}, {"2024\x7f" "02", "YYYY-MM", 1861}, {"2024-ab", "YYYY\"-ac\"", 1861}, {"2024×02", "YYYY\"÷\"MM", 1861},
        {"2024/02/01", "FXYYYY-MM-DD", 1861}, {"2024-02-01 ", "FXYYYY-MM-DD", 1830},
        {"1999 MAY       ", "FXYYYY MONTH", 1830}, {"2024-2-01", "FXYYYY-MM-DD", 1862}, {"2,24", "Y,YYY", 1862},
        {"x", "Y,YYY", 1858}, {"12,024", "Y,YYY", 1861}, {"1.1234567891", "SSXFF", 1830}, {"-+44", "SYYYY", 1858}, {"200405", "YY-MM", 1830}, {"0140201", "MM-YY", 1830},
        {"2024-01", "YYYY-MM-DD", 1840}, {"", "YYYY", 1840}, {"2024", "FXYYYY HH24", 1840}, {"JAN", "FXMM", 1858},
        {"2024-01-01 10", "YYYY-MM-DD", 1830}, {"2024-01-01x", "YYYY-MM-DD", 1830}, {"2024", "YYYQ", 1820},
        {"1", "Q", 1820}, {"1", "DDTH", 1820}, {"one", "DDSP", 1820}, {"20", "CC", 1820}, {"2024", "IYYY", 1820}, {"4", "I", 1820},
        {"2024", "ZZ", 1821}, {"1 1", "DD DD", 1810}, {"1 1", "MI MI", 1810}, {"1 1", "J DDD", 1811},
        {"2024 24", "YYYY YY", 1812}, {"1 1", "HH HH24", 1813}, {"AM AM", "AM PM", 1814}, {"BC BC", "BC AD", 1815},
        {"1 JAN", "MM MON", 1816}, {"MON 1", "DY D", 1817}, {"10 AM", "HH24 AM", 1818}, {"AM 10", "AM HH24", 1818},
        {"2024 BC", "SYYYY BC", 1819}, {"2460370 2023", "J YYYY", 1831}, {"2460370 1", "J MM", 1833},
        {"2460370 1", "J DD", 1834}, {"2024-02-29 MON", "YYYY-MM-DD DY", 1835}, {"3600 2", "SSSSS HH24", 1836},
        {"3600 1", "SSSSS MI", 1837}, {"3600 1", "SSSSS SS", 1838}, {"10 +15:00", "HH24 TZH:TZM", 1874},
        {"2024-2-9", "FXFMYYYY-MM-FMDD", 1862}, {"2024- 02-09", "FXYYYY-MM-DD", 1858}, {"2024", "FXYYYYHH24", 1840},
        {"2024 -02", "YYYY MM", 1858}, {"2024 of02", "FXYYYY\"of\"MM", 1861}, {"2024o", "YYYY\"of\"", 1840},
        {"1404", "FXYY", 1830}, {"2024", "Y,YYY", 1861}, {"01,5", "FXSSXFF1", 1861}, {"1.2345", "SSXFF3", 1830},
        {"01.5", "FXSSXFF3", 1862}, {"2024-000", "YYYY-DDD", 1848}, {"0000-001", "YYYY-DDD", 1841}, {"0", "D", 1846},
        {"1721059", "J", 1864}, {"1721423", "J", 1864}, {"3600 1 PM", "SSSSS HH AM", 1836},
        {"10 +05:60", "HH24 TZH:TZM", 1875}, {"10 Atlantis", "HH24 TZR", 1882}, {"10 12", "HH24 TZD", 1857},
    };
    for (const auto& c : cases)
        EXPECT_EQ(Parse(c.text, c.model), std::to_string(c.number)) << c.text << " | " << c.model;
}

TEST(DateFromText, MissingFieldsAreOfToday) {
    DateTime now, value;
    ASSERT_EQ(Now(&now), 0);
    ASSERT_EQ(FromText("13:14", "HH24:MI", kEnglish, Scope::date, &value), 0);
    EXPECT_EQ(value.year, now.year);
    EXPECT_EQ(value.month, now.month);
    EXPECT_EQ(value.day, 1);
    ASSERT_EQ(FromText("02-03", "MM-DD", kEnglish, Scope::date, &value), 0);
    EXPECT_EQ(value.year, now.year);
    const int century = now.year - now.year % 100;
    ASSERT_EQ(FromText("01-01-07", "DD-MM-YY", kEnglish, Scope::date, &value), 0);
    EXPECT_EQ(value.year, century + 7);
    ASSERT_EQ(FromText("0412", "YYMM", kEnglish, Scope::date, &value), 0);    // four digits, but a number follows
    EXPECT_EQ(value.year, century + 4);
    EXPECT_EQ(value.month, 12);
    // RR: the year of those two digits in the half of a century that lies nearer.
    const bool first_half = now.year % 100 < 50;
    ASSERT_EQ(FromText("01-01-49", "DD-MM-RR", kEnglish, Scope::date, &value), 0);
    EXPECT_EQ(value.year, century + 49 + (first_half ? 0 : 100));
    ASSERT_EQ(FromText("01-01-50", "DD-MM-RR", kEnglish, Scope::date, &value), 0);
    EXPECT_EQ(value.year, century + 50 - (first_half ? 100 : 0));
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
