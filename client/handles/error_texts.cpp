// Looking up the published wording and the SQLSTATE of a number.
#include <algorithm>
#include <array>

#include "handles/error_handle.h"

namespace {

struct Wording {
    int number;
    std::string_view text;
};

constexpr Wording kWordings[] = {
#define NAMED(number, name, text) {number, text},
#define WORDING(number, text) {number, text},
#include "handles/error_texts.def"
#undef WORDING
#undef NAMED
};

static_assert(std::is_sorted(std::begin(kWordings), std::end(kWordings),
                             [](const Wording& left, const Wording& right) { return left.number <= right.number; }),
              "ascending, each number once");

// Which numbers have which SQLSTATE. The first row that holds a number decides, so that single numbers stand before the
// ranges around them.
struct StateRange {
    int first;
    int last;
    std::string_view state;
};

constexpr StateRange kStates[] = {
    {0, 0, "00000"},
    {1, 1, "23000"},
    {18, 21, "61000"},
    {22, 22, "42000"},
    {23, 35, "61000"},
    {50, 68, "61000"},
    {100, 120, "63000"},
    {251, 251, "42000"},
    {370, 429, "60000"},
    {440, 569, "63000"},
    {600, 899, "60000"},
    {900, 999, "42000"},
    {1001, 1003, "24000"},
    {1017, 1017, "28000"},
    {1031, 1031, "42000"},
    {1095, 1095, "02000"},
    {1000, 1099, "72000"},
    {1400, 1400, "23000"},
    {1401, 1401, "22001"},
    {1402, 1402, "44000"},
    {1403, 1403, "02000"},
    {1405, 1405, "22002"},
    {1406, 1406, "22001"},
    {1407, 1407, "23000"},
    {1410, 1410, "24000"},
    {1422, 1422, "21000"},
    {1424, 1425, "22025"},
    {1426, 1426, "22003"},
    {1427, 1427, "21000"},
    {1438, 1438, "22003"},
    {1453, 1453, "25000"},
    {1455, 1455, "22003"},
    {1457, 1457, "22003"},
    {1476, 1476, "22012"},
    {1479, 1480, "22024"},
    {1401, 1489, "72000"},
    {1490, 1493, "42000"},
    {1700, 1799, "42000"},
    {1800, 1899, "22008"},
    {2091, 2092, "40000"},
    {1900, 2099, "42000"},
    {2140, 2289, "42000"},
    {2290, 2299, "23000"},
    {2376, 2399, "61000"},
    {2420, 2424, "42000"},
    {3106, 3135, "66000"},
    {4020, 4039, "61000"},
    {4040, 4059, "42000"},
    {4163, 4163, "22023"},
    {4165, 4165, "22023"},
    {6430, 6449, "60000"},
    {6511, 6511, "24000"},
    {6500, 6599, "65000"},
    {8006, 8006, "24000"},
    {8177, 8177, "40001"},
    {12899, 12899, "22001"},
    {12100, 12599, "66000"},
};

}  // namespace

std::string_view ErrorText(int number) noexcept {
    const auto* row = std::lower_bound(std::begin(kWordings), std::end(kWordings), number,
                                       [](const Wording& wording, int wanted) { return wording.number < wanted; });
    if (row != std::end(kWordings) && row->number == number) return row->text;
    if (number >= 20000 && number <= 20999) return "application error";
    return "message not found";
}

std::string_view SqlState(int number) noexcept {
    for (const StateRange& range : kStates) {
        if (number >= range.first && number <= range.last) return range.state;
    }
    return "HY000";
}
