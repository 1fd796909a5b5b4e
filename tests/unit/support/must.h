// Calls that are made one after another and must all answer 0.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <initializer_list>

inline testing::AssertionResult AllAnswerZero(const char* calls, std::initializer_list<int> answers) {
    if (std::all_of(answers.begin(), answers.end(), [](int answer) { return answer == 0; })) return testing::AssertionSuccess();
    return testing::AssertionFailure() << calls << " answer " << testing::PrintToString(answers);
}

// Ends the test, or lets it go on.
#define MUST(...) ASSERT_TRUE(AllAnswerZero(#__VA_ARGS__, {__VA_ARGS__}))
#define SHOULD(...) EXPECT_TRUE(AllAnswerZero(#__VA_ARGS__, {__VA_ARGS__}))
