// Which character set a code-page number stands for. All are stateless, so that a text may end after any character.
// Some share a converter: 5348 is 1252 with the euro sign, which 1252 has long had; of 1381 and 1383 what both have in
// common, GB 2312, is converted; 932 and 943 go by CP932, since the converters named after them turn what they do not
// have into a delete character and do not say so.
#include "platform/code_page_table.h"

#include <algorithm>
#include <iterator>

namespace {

// In order of number. Of the rows that share a name the first answers for the character set.
constexpr CodePage kCodePages[] = {
    {37, "IBM037"},          {273, "IBM273"},         {277, "IBM277"},         {278, "IBM278"},
    {280, "IBM280"},         {284, "IBM284"},         {285, "IBM285"},         {297, "IBM297"},
    {367, "ANSI_X3.4-1968"}, {437, "IBM437"},         {500, "IBM500"},         {813, "ISO-8859-7"},
    {819, "ISO-8859-1"},     {850, "IBM850"},         {852, "IBM852"},         {855, "IBM855"},
    {857, "IBM857"},         {858, "IBM858"},         {860, "IBM860"},         {861, "IBM861"},
    {862, "IBM862"},         {863, "IBM863"},         {864, "IBM864"},         {865, "IBM865"},
    {866, "IBM866"},         {869, "IBM869"},         {870, "IBM870"},         {871, "IBM871"},
    {874, "IBM874"},         {878, "KOI8-R"},         {912, "ISO-8859-2"},     {913, "ISO-8859-3"},
    {914, "ISO-8859-4"},     {915, "ISO-8859-5"},     {916, "ISO-8859-8"},     {920, "ISO-8859-9"},
    {921, "ISO-8859-13"},    {923, "ISO-8859-15"},    {932, "CP932"},          {943, "CP932"},
    {949, "UHC"},            {950, "BIG5"},           {954, "EUC-JP"},         {964, "EUC-TW"},
    {970, "EUC-KR"},         {1026, "IBM1026"},       {1047, "IBM1047"},       {1089, "ISO-8859-6"},
    {1140, "IBM1140"},       {1141, "IBM1141"},       {1148, "IBM1148"},       {1200, "UTF-16BE", 2},
    {1202, "UTF-16LE", 2},   {1208, "UTF-8"},         {1250, "CP1250"},        {1251, "CP1251"},
    {1252, "CP1252"},        {1253, "CP1253"},        {1254, "CP1254"},        {1255, "CP1255"},
    {1256, "CP1256"},        {1257, "CP1257"},        {1258, "CP1258"},        {1381, "EUC-CN"},
    {1383, "EUC-CN"},        {1386, "GBK"},           {5348, "CP1252"},        {5488, "GB18030"},
    {13488, "UCS-2BE", 2},   {54936, "GB18030"},
};
static_assert(std::ranges::is_sorted(kCodePages, {}, &CodePage::number));

// Locales write some names in other ways: case, hyphens and underscores do not count.
bool SameName(std::string_view left, std::string_view right) {
    const auto skip = [](std::string_view& name) {
        while (!name.empty() && (name[0] == '-' || name[0] == '_')) name.remove_prefix(1);
    };
    const auto lower = [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 'a' - 'A') : c; };
    for (;; left.remove_prefix(1), right.remove_prefix(1)) {
        skip(left);
        skip(right);
        if (left.empty() || right.empty()) return left.empty() && right.empty();
        if (lower(left[0]) != lower(right[0])) return false;
    }
}

}  // namespace

const CodePage* FindCodePage(std::uint32_t number) {
    const auto row = std::ranges::lower_bound(kCodePages, number, {}, &CodePage::number);
    return row != std::end(kCodePages) && row->number == number ? row : nullptr;
}

const CodePage* FindCharacterSet(std::string_view name) {
    const auto row = std::ranges::find_if(kCodePages, [&](const CodePage& page) { return SameName(page.name, name); });
    return row != std::end(kCodePages) ? row : nullptr;
}
