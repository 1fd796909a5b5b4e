// Numbers to and from text by a model.
#include "number/format.h"

#include <gtest/gtest.h>

#include "reference.h"

namespace {

constexpr std::string_view kGerman =
    "NLS_NUMERIC_CHARACTERS='',.'' NLS_CURRENCY=''\xE2\x82\xAC'' NLS_ISO_CURRENCY=Germany NLS_DUAL_CURRENCY=DM";

// The text, or the error's number.
std::string Formatted(std::string_view literal, std::string_view model, std::string_view nls_text = {},
                      std::size_t capacity = 200) {
    char text[200];
    std::size_t length = 0;
    number::Nls nls;
    number::Errno error = number::ParseNls(nls_text, &nls);
    if (!error) error = number::ToText(Number(literal), model, nls, text, capacity, &length);
    return error ? std::to_string(error) : std::string(text, length);
}

// The plain text of the number, or the error's number.
std::string Parsed(std::string_view text, std::string_view model, std::string_view nls_text = {}) {
    OCINumber value;
    number::Nls nls;
    number::Errno error = number::ParseNls(nls_text, &nls);
    if (!error) error = number::FromText(text, model, nls, &value);
    return error ? "error " + std::to_string(error) : Shown(value);
}

}  // namespace

TEST(NumberToText, EveryElement) {
    const struct { const char* number; const char* model; const char* text; } cases[] = {
        {"0", "99.99", "   .00"}, {"0.1", "99.99", "   .10"}, {"-0.2", "99.99", "  -.20"}, {"0", "90.99", "  0.00"},
        {"-0.2", "90.99", " -0.20"}, {"0", "9999", "    0"}, {"123.456", "999.999", " 123.456"},
        {"-1234", "9,999", "-1,234"}, {"12", "9,999", "    12"}, {"12", "0,999", " 0,012"}, {"12", "0999", " 0012"},
        {"1234567.891", "9G999G999D99", " 1,234,567.89"}, {"-1234.5", "$9,999.99", "-$1,234.50"},
        {"12", "$9999", "   $12"}, {"12", "99$", " $12"}, {"0", "B9999", "     "}, {"0", "B90.99", "      "},
        {"0.5", "B90.99", "   .50"}, {"-12", "99MI", "12-"}, {"12", "99MI", "12 "}, {"12", "FM99MI", "12"}, {"-12", "FM99MI", "12-"},
        {"12", "S9999", "  +12"}, {"-12", "S9999", "  -12"}, {"5", "9S", "5+"}, {"12", "9999S", "  12+"}, {"-12", "99PR", "<12>"},
        {"12", "999PR", "  12 "}, {"-5", "FM999PR", "<5>"}, {"123.456", "9.9EEEE", " 1.2E+02"},
        {"1E123", "9.9EEEE", " 1.0E+123"}, {"-0.00996", "9.9EEEE", "-1.0E-02"}, {"0", "9.9EEEE", " 0.0E+00"},
        {"12.345", "99V99", " 1235"}, {"0.04", "9V99", "   4"}, {"0.04", "9V09", "  04"}, {"0.5", "TM", ".5"},
        {"-123.40", "TM9", "-123.4"}, {"123", "TME", "1.23E+02"}, {"0", "TME", "0E+00"},
        {"1E63", "TM9", "1000000000000000000000000000000000000000000000000000000000000000"}, {"-1E63", "TM9", "-1E+63"},
        {"1E-63", "TM", ".000000000000000000000000000000000000000000000000000000000000001"}, {"-1E-63", "TM", "-1E-63"},
        {"0", "TM", "0"}, {"255", "XXXX", "   FF"}, {"255.5", "xxx", " 100"}, {"255", "0XXX", " 00FF"},
        {"255", "FMXXX", "FF"}, {"0", "XX", "  0"}, {"1E20", "XXXXXXXXXXXXXXXXX", " 56BC75E2D63100000"},
        {"1999", "RN", "        MCMXCIX"}, {"3888", "FMrn", "mmmdccclxxxviii"}, {"123.456", "FM999.009", "123.456"},
        {"123.45", "FM999.009", "123.45"}, {"123", "FM999.009", "123.00"}, {"12", "FM99.99", "12."},
        {"0", "FM99.99", "0."}, {"12", "FM0999", "0012"}, {"12", "L999", "  $12"}, {"12", "999C", "  12USD"}, {"-12", "99CS", "12USD-"},
        {"12.5", "99.9$", " $12.5"}, {"12", "", "12"}, {"1E50", "", "1E+50"},
        // Digits beyond a pair of places are kept whatever V moves.
        {"12345678901234567890123456789012345678.91", "FM99999999999999999999999999999999999999V999",
         "12345678901234567890123456789012345678910"},
        {"-.9876543210987654321098765432109876543211", "9V99999999999999999999999999999999999999999",
         " -98765432109876543210987654321098765432110"},
        {"0.96", "9V9", " 10"}, {"0", "9V99", "   0"}, {"0", "FM9V99", "0"}, {"9.94E125", "9.9EEEE", " 9.9E+125"}, {"-9.96E-101", "9.9EEEE", "-1.0E-100"},
        {"-9.96E-100", "9.9EEEE", "-1.0E-99"}, {"1E-130", "99EEEE", " 1E-130"},
        // A negative value stays one when its digits become 0.
        {"-0.001", "9.99", " -.00"}, {"-0.001", "9.99S", " .00-"}, {"-0.001", "9.99PR", " <.00>"},
        {"5", "FM999PR", "5"}, {"255", "xX", " ff"}, {"4", "FMrN", "iv"}, {"1", "FMRN", "I"}, {"3999", "FMRN", "MMMCMXCIX"},
        {"1.5", "FM9.90", "1.50"}, {"1.5", "FM9.99EEEE", "1.5E+00"}, {"120", "FM9.99EEEE", "1.2E+02"}, {"1.5", "FM9.90EEEE", "1.50E+00"},
        {"1E100", "9.9EEEE", " 1.0E+100"}, {"1E-100", "9.9EEEE", " 1.0E-100"}, {"0.6", "9", " 1"}, {"0.04", "FM9.9", "0."},
        {"-0.4", "99MI", " 0-"},     {"-0.001", "B9.99", "     "},
    };
    for (const auto& c : cases) EXPECT_EQ(Formatted(c.number, c.model), c.text) << c.number << " by " << c.model;
}

TEST(NumberToText, WhatDoesNotFitTheModel) {
    const struct { const char* number; const char* model; const char* text; } cases[] = {
        {"123", "99", "###"}, {"-123", "99.9", "#####"}, {"123", "FM99", "###"}, {"256", "XX", "###"}, {"256", "FMXX", "##"},
        {"1.5", ".99", "####"}, {"4000", "RN", "###############"}, {"0", "RN", "###############"},
        {"99.96", "99.9", "22065"}, {"9.5", "9", "22065"}, {"9.96", "9V9", "22065"}, {"10", "9V9", "###"},
        {"9.95E125", "9.9EEEE", "22065"}, {"-9.999999999E125", "9EEEE", "22065"}, {"-1", "XX", "22060"}};
    for (const auto& c : cases) EXPECT_EQ(Formatted(c.number, c.model), c.text) << c.number << " by " << c.model;
    EXPECT_EQ(Formatted("12", "999", "", 3), "22059");
    EXPECT_EQ(Formatted("12", "999", "", 4), "  12");
    std::size_t needed = 0;
    EXPECT_EQ(number::ToText(Number("1E30"), std::string(9000, '9'), {}, nullptr, 0, &needed), 22059);
    EXPECT_EQ(needed, 9001u);
}

TEST(NumberToText, ModelsThatAreNone) {
    for (const char* model :
         {"9LB9", "9L.", "9EEEE.", "9EEEE,", "9EEEEEEEE", "9V9EEEE", ".9EEEE", "9G9.9", "9,9D9", "9.9,9", "9V9,9", ".L9", "S99MI",
          "Q",    "9 9", "9.9.9", ",99", "9,G9", "9D9.9", ".9,9",   "99MI9",   "MI99", "99MIS", "S99S",
          "9S9",  "S",   "$",     "$$9", "LC9",  "BB9",   "9EEEE9", "9,9EEEE", "EEEE", "9V9.9", "TM8",
          "TM99", "9TM", "XX9",   "X0",  "RNX",  "9FM",   "FM",     "FMFM9",   ".",    "G9",    "9LL9"})
        EXPECT_EQ(Formatted("1", model), "22061") << model;
}

TEST(NumberToText, SettingsOfTheNlsText) {
    EXPECT_EQ(Formatted("1234567.5", "9G999G999D99", kGerman), " 1.234.567,50");
    EXPECT_EQ(Formatted("1234", "9,999", kGerman), " 1,234") << "as it is written";
    EXPECT_EQ(Formatted("12", "L999", kGerman), "  \xE2\x82\xAC" "12");
    EXPECT_EQ(Formatted("12.5", "99L99", kGerman), " 12\xE2\x82\xAC" "50");
    EXPECT_EQ(Formatted("123", "L99", "NLS_CURRENCY=''\xC2\xA3\xC2\xA3\xC2\xA3\xC2\xA3$$$$$$''"), std::string(13, '#'));
    EXPECT_EQ(Formatted("12", "C99U", kGerman), "22061");
    EXPECT_EQ(Formatted("12", "99U", kGerman), " 12DM");
    EXPECT_EQ(Formatted("12", "FM99C", kGerman), "12EUR");
    EXPECT_EQ(Formatted("1.5", "", kGerman), "1,5");
    EXPECT_EQ(Formatted("1.5", "TM", "nls_numeric_characters = ''; ''"), "1;5");
    for (const char* nls :
         {"x", "NLS_CURRENCY", "NLS_CURRENCY=''a", "NLS_CURRENCY=''12345678901''", "NLS_DATE_LANGUAGE=x",
          "NLS_NUMERIC_CHARACTERS=''..''", "NLS_NUMERIC_CHARACTERS=''.''", "NLS_NUMERIC_CHARACTERS=''.-''",
          "NLS_NUMERIC_CHARACTERS=''1,''", "NLS_ISO_CURRENCY=ATLANTIS", "= ''a''",
          "NLS_NUMERIC_CHARACTERS=''\xC3\xA4''", "NLS_NUMERIC_CHARACTERS=''\xA4.''",
          "NLS_NUMERIC_CHARACTERS=''.\xA4''"})
        EXPECT_EQ(Formatted("1", "9", nls), "22064") << nls;
}

TEST(NumberFromText, EveryElement) {
    const struct { const char* text; const char* model; const char* number; } cases[] = {
        {"12.5", "99.9", "12.5"}, {"  -12", "999", "-12"}, {"1,234", "9,999", "1234"},    {"1234", "9,999", "1234"},
        {"$12", "$99", "12"},     {"-$12", "$99", "-12"},  {"$-12", "$99", "-12"},        {"12", "$99", "12"},
        {"12-", "99MI", "-12"},   {"12 ", "99MI", "12"},   {"<12>", "99PR", "-12"},       {" 12 ", "99PR", "12"},
        {"+12", "S99", "12"},     {"12-", "99S", "-12"},   {"1.2E+02", "9.9EEEE", "120"}, {"1234", "99V99", "12.34"},
        {"FF", "XX", "255"},      {"1f", "XXX", "31"},     {"MCMXCIX", "RN", "1999"},     {"iv", "rn", "4"},
        {"1.5e3", "TM9", "1500"}, {".5", "9.9", ".5"},     {"5", "0999", "5"},            {"-1.25e-2", "", "-.0125"},
        {"12", "99.9", "12"},     {"  ", "B99", "0"},      {"12", "99L99", "12"},
        // A model of nines as long as the literal takes any literal.
        {"0.0", "999", "0"}, {"-12.5", "99999", "-12.5"}, {"1e5", "999", "100000"},
    };
    for (const auto& c : cases) EXPECT_EQ(Parsed(c.text, c.model), c.number) << c.text << " by " << c.model;
    EXPECT_EQ(Parsed("1.234,5", "9G999D9", kGerman), "1234.5");
    EXPECT_EQ(Parsed("1,234", "9,999", kGerman), "1234");
    EXPECT_EQ(Parsed("\xE2\x82\xAC" "12", "L99", kGerman), "12");
    EXPECT_EQ(Parsed(std::string(2000, '0') + "5.5", std::string(2001, '9') + ".9"), "5.5");
    EXPECT_EQ(Parsed("12EUR", "99C", kGerman), "12");
    EXPECT_EQ(Parsed("12\xE2\x82\xAC" "5", "99L99", kGerman), "12.5");
    EXPECT_EQ(Parsed("12DM", "99U", kGerman), "12");
}

TEST(NumberFromText, TextsThatDoNotFit) {
    const struct { const char* text; const char* model; const char* error; } cases[] = {
        {"", "9", "22062"},       {"", "", "22062"},        {"   ", "9", "22062"},    {"abc", "999", "22062"},
        {"123", "99", "22062"},   {"1.23", "9.9", "22062"}, {"1.5", "9999", "22062"}, {"12,34", "9,999", "22062"},
        {"1 2", "9999", "22062"}, {"<12", "99PR", "22062"}, {"12>", "99PR", "22062"}, {"FG", "XX", "22062"},
        {"FFF", "XX", "22062"},   {"IIII", "RN", "22062"},  {"CMD", "RN", "22062"},   {"XCX", "RN", "22062"},
        {"-", "99", "22062"},     {"12x", "99", "22062"},   {"1,23", "9,999", "22062"}, {"   ", "XX", "22062"},
        {"MMMM", "RN", "22062"},   {"  ", "RN", "22062"},     {"1x234", "9,999", "22062"},     {"", "B99", "22062"},
        {"--1", "999", "22062"},  {"1e200", "", "22053"},   {"1e-200", "", "22054"},  {"1", "9Z", "22061"}};
    for (const auto& c : cases)
        EXPECT_EQ(Parsed(c.text, c.model), std::string("error ") + c.error) << c.text << " by " << c.model;
    EXPECT_EQ(Parsed(std::string(9000, '9'), std::string(9000, '9')), "error 22053");
    EXPECT_EQ(Parsed("1" + std::string(99, '0'), std::string(100, '9')), "1E+99");
}

TEST(NumberFromText, WhatToTextWroteComesBack) {
    RandomNumbers numbers(31);
    for (const char* model : {"9999.99", "0999.90", "$9,999.99", "S9999.99", "9999.99S", "9999.99MI", "9999.99PR",
                              "FM9999.99", "L9999.99", "9G999D99", "FM$0,999.09PR", "B9999.90"}) {
        for (int i = 0; i < 100; ++i) {
            OCINumber value = numbers.Next(0), wanted;
            ASSERT_EQ(number::Round(value, 2, &wanted), 0);
            const std::string text = Formatted(Shown(value), model);
            EXPECT_EQ(Parsed(text, model), Shown(wanted)) << "'" << text << "' by " << model;
        }
    }
}
