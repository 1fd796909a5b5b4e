// The code pages of the process, from its environment or its locale. Any thread.
#include <langinfo.h>
#include <locale.h>

#include <charconv>
#include <cstdlib>
#include <string>
#include <string_view>

#include "platform/code_page.h"
#include "platform/code_page_table.h"

namespace {

std::uint32_t LocaleCodePage() {
    const locale_t user = newlocale(LC_CTYPE_MASK, "", nullptr);
    if (!user) return kCodePageUtf8;
    const std::string name = nl_langinfo_l(CODESET, user);
    freelocale(user);
    constexpr std::string_view kCLocale = "ANSI_X3.4-1968";
    const CodePage* const page = name == kCLocale ? nullptr : FindCharacterSet(name);
    return page ? page->number : kCodePageUtf8;
}

bool ReadNumber(std::string_view text, std::uint32_t& number) {
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    return error == std::errc() && end == text.data() + text.size();
}

}  // namespace

int GetProcessCodePage(std::uint32_t* first, std::uint32_t* second) {
    *first = *second = LocaleCodePage();
    const char* const setting = std::getenv("KELPCI_CODEPAGE");
    if (!setting || !*setting) return kCodePageDone;

    const std::string_view pair = setting;
    const std::size_t comma = pair.find(',');
    const std::string_view second_word = comma == pair.npos ? pair : pair.substr(comma + 1);
    std::uint32_t one, other;
    if (!ReadNumber(pair.substr(0, comma), one) || !ReadNumber(second_word, other)) return kCodePageBadArgument;
    if (!FindCodePage(one) || !FindCodePage(other)) return kCodePageUnknown;
    *first = one;
    *second = other;
    return kCodePageDone;
}
