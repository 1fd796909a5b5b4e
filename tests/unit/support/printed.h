// What an action writes to the log.
#pragma once

#include <gtest/gtest.h>

#include <string>

inline std::string Printed(auto&& action) {
    testing::internal::CaptureStdout();
    action();
    return testing::internal::GetCapturedStdout();
}
