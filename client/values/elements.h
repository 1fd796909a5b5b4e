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
    char* lengths = nullptr;           // unsigned, of 16 bits or of 32
    std::size_t length_step = sizeof(std::uint16_t);
    bool wide_lengths = false;
    char* codes = nullptr;             // unsigned 16-bit
    std::size_t code_step = sizeof(std::uint16_t);

    [[nodiscard]] char* Value(std::size_t index) const { return values ? values + index * value_step : nullptr; }

    [[nodiscard]] bool IsNull(std::size_t index) const {
        std::int16_t indicator = 0;
        if (indicators) std::memcpy(&indicator, indicators + index * indicator_step, sizeof indicator);
        return indicator == kNullIndicator;
    }
    [[nodiscard]] std::uint32_t Length(std::size_t index) const {
        std::uint32_t wide = 0;
        std::uint16_t length = 0;
        const char* const at = lengths + index * length_step;
        if (wide_lengths) std::memcpy(&wide, at, sizeof wide);
        else std::memcpy(&length, at, sizeof length);
        return wide_lengths ? wide : length;
    }
    void SetIndicator(std::size_t index, std::int16_t indicator) const {
        if (indicators) std::memcpy(indicators + index * indicator_step, &indicator, sizeof indicator);
    }
    void SetLength(std::size_t index, std::uint32_t length) const {
        if (!lengths) return;
        char* const at = lengths + index * length_step;
        const auto shown = static_cast<std::uint16_t>(length < 0xFFFF ? length : 0xFFFF);
        if (wide_lengths) std::memcpy(at, &length, sizeof length);
        else std::memcpy(at, &shown, sizeof shown);
    }
    void SetCode(std::size_t index, int number) const {
        const auto code = static_cast<std::uint16_t>(number);
        if (codes) std::memcpy(codes + index * code_step, &code, sizeof code);
    }
};

}  // namespace values
