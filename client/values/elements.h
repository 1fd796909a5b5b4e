// The application's arrays behind a bind or define: value areas with indicators, lengths and return codes beside them,
// each with its own step. The areas are the application's, at any alignment; what it did not give is null.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace values {

constexpr std::int16_t kNullIndicator = -1;
constexpr std::int16_t kLongIndicator = -2;    // a truncated value longer than an indicator can say

struct Elements {
    char* values = nullptr;
    std::uint32_t size = 0;            // bytes of one value area
    std::size_t value_step = 0;        // bytes from one element to the next
    char* indicators = nullptr;        // signed 16-bit
    std::size_t indicator_step = sizeof(std::int16_t);
    char* lengths = nullptr;           // unsigned 16-bit
    std::size_t length_step = sizeof(std::uint16_t);
    char* codes = nullptr;             // unsigned 16-bit
    std::size_t code_step = sizeof(std::uint16_t);

    [[nodiscard]] char* Value(std::size_t index) const { return values ? values + index * value_step : nullptr; }

    [[nodiscard]] bool IsNull(std::size_t index) const {
        std::int16_t indicator = 0;
        if (indicators) std::memcpy(&indicator, indicators + index * indicator_step, sizeof indicator);
        return indicator == kNullIndicator;
    }
    [[nodiscard]] std::uint16_t Length(std::size_t index) const {
        std::uint16_t length = 0;
        std::memcpy(&length, lengths + index * length_step, sizeof length);
        return length;
    }
    void SetIndicator(std::size_t index, std::int16_t indicator) const {
        if (indicators) std::memcpy(indicators + index * indicator_step, &indicator, sizeof indicator);
    }
    void SetLength(std::size_t index, std::uint32_t length) const {
        const auto shown = static_cast<std::uint16_t>(length < 0xFFFF ? length : 0xFFFF);
        if (lengths) std::memcpy(lengths + index * length_step, &shown, sizeof shown);
    }
    void SetCode(std::size_t index, int number) const {
        const auto code = static_cast<std::uint16_t>(number);
        if (codes) std::memcpy(codes + index * code_step, &code, sizeof code);
    }
};

}  // namespace values
