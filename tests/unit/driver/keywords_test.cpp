// The ways of decoding a word.
#include <climits>

#include "core/keywords.h"
#include "support/printed.h"

namespace {

TEST(Keywords, FirstKeywordThatTheWordBegins) {
    const struct { const char* word; const KeywordTable* table; int value; } cases[] = {
        {"sqlt_t", SqltKeywords, 185}, {"SQLT_TIME_TZ", SqltKeywords, 186}, {"sqlt_timestamp", SqltKeywords, 187},
        {"sqlt_timex", SqltKeywords, -128}, {"oci_d", FetchOrientationKeywords, 0},
        {"OCI_DEFAULT", FetchOrientationKeywords, 0}, {"oci_fetch_n", FetchOrientationKeywords, 2},
        {"t", BooleanKeywords, 1}, {"1", BooleanKeywords, 1}, {"2", BooleanKeywords, -128},
        {"tmasync", XaFlagKeywords, INT_MIN}, {"oci_dtype_r", HandleTypeKeywords, 52},
        {"oci_dtype_i", DescriptorTypeKeywords, 63}, {" oci_default", FetchOrientationKeywords, -128}};
    for (const auto& c : cases) EXPECT_EQ(DecodeKeyword(c.word, c.table), c.value) << c.word;
    EXPECT_EQ(DecodeKeyword(std::string(9999, 'o').c_str(), EnvModeKeywords), -128);
}

// What a decoding gives and prints.
struct Decoded { int value; std::string printed; };
template <class Function> Decoded Decode(Function decode, const std::string& word, const KeywordTable* table) {
    Decoded decoded;
    decoded.printed = Printed([&] { decoded.value = decode(word.c_str(), table); });
    return decoded;
}

const std::string kEmptyWord = "DecodeKeyword(): Null length token.\n";
std::string Unrecognized(const std::string& piece) {
    return "Warning : Unrecognized Token in bitmask : " + piece + "\n";
}

TEST(Keywords, BitmaskIsTheOrOfItsWords) {
    const std::string long_piece = "oci_threaded" + std::string(200, 'x');
    const struct { std::string word; int value; std::string printed; } cases[] = {
        {"oci_threaded|oci_object", 3, ""}, {"OCI_UTF16|oci_t", 16385, ""}, {" oci_threaded | oci_object ", 3, ""},
        {"\toci_thr\teaded|\t oci_object\t", 3, ""}, {"oci_threaded|Bogus", 1, Unrecognized("Bogus")},
        {"oci_threaded|", 1, kEmptyWord}, {"", 0, kEmptyWord}, {"|", 0, kEmptyWord + kEmptyWord},
        {"7", 0, Unrecognized("7")}, {long_piece, 0, Unrecognized(long_piece.substr(0, 128))}};
    for (const auto& c : cases) {
        const Decoded decoded = Decode(DecodeBitmask, c.word, EnvModeKeywords);
        EXPECT_EQ(decoded.value, c.value) << c.word;
        EXPECT_EQ(decoded.printed, c.printed) << c.word;
    }
}

TEST(Keywords, AWordThatMatchesNothingIsANumber) {
    Decoded decoded = Decode(DecodeBitmaskOrNumber, "16384", EnvModeKeywords);
    EXPECT_EQ(decoded.value, 16384);
    EXPECT_EQ(decoded.printed, Unrecognized("16384"));
    decoded = Decode(DecodeBitmaskOrNumber, "7|oci_default", EnvModeKeywords);
    EXPECT_EQ(decoded.value, 0) << "one word matched, so the number does not count";
    decoded = Decode(DecodeKeywordOrNumber, "-12abc", FetchModeKeywords);
    EXPECT_EQ(decoded.value, -12);
    EXPECT_EQ(decoded.printed, "");
    EXPECT_EQ(Decode(DecodeKeyword, "", FetchModeKeywords).printed, kEmptyWord);
}

TEST(Keywords, NumbersEndAtTheFirstOtherCharacter) {
    const struct { const char* word; int value; } cases[] = {
        {"12", 12}, {" -7x", -7}, {"+3", 3}, {"abc", 0}, {"", 0}, {"4294967295", -1}, {"0x10", 0}};
    for (const auto& c : cases) EXPECT_EQ(DecodeNumber(c.word), c.value) << c.word;
}

}  // namespace
