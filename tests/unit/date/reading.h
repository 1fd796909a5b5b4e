// Dates of tests, written in the form that engines keep.
#pragma once

#include <gtest/gtest.h>

#include <string_view>

#include "date/date.h"

inline date::DateTime Read(std::string_view text) {
    date::DateTime value;
    EXPECT_EQ(date::FromEngineText(text, &value), 0) << text;
    return value;
}
