// Texts read as dates by a model, at random. Transcripts have the elements.
#include <gtest/gtest.h>

#include <random>

#include "date/format.h"

namespace {

using namespace date;

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
