// Texts out of the catalogue, in lines.
#include "platform/message_texts.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

#include "platform/message_catalogue.h"

namespace {

// Where the first line of the text ends.
std::size_t LineLength(std::string_view text, std::size_t width) {
    const std::size_t feed = text.find('\n');
    if (feed <= width) return feed;
    if (text.size() <= width) return text.size();
    const std::size_t blank = text.rfind(' ', width);
    return blank == text.npos || blank == 0 ? width : blank;
}

std::size_t CopyInLines(std::string_view text, char* buffer, std::size_t capacity, std::size_t width) {
    if (capacity == 0) return 0;
    std::string lines;
    while (!text.empty()) {
        const std::size_t length = LineLength(text, std::max<std::size_t>(width, 1));
        if (!lines.empty()) lines += '\n';
        lines += text.substr(0, length);
        text.remove_prefix(length);
        if (text.starts_with(' ') || text.starts_with('\n')) text.remove_prefix(1);
    }
    const std::size_t length = std::min(lines.size(), capacity - 1);
    std::memcpy(buffer, lines.data(), length);
    buffer[length] = '\0';
    return length;
}

std::string_view Words(const SQLCA& diagnostics) {
    const auto given = static_cast<std::size_t>(std::max<sb2>(diagnostics.sqlerrml, 0));
    std::string_view words(diagnostics.sqlerrmc, std::min(given, sizeof diagnostics.sqlerrmc));
    while (words.ends_with(' ') || words.ends_with('\n') || words.ends_with('\0')) words.remove_suffix(1);
    return words;
}

// "ORA-nnnnn". Of the diagnostics' codes 100 alone is no error number.
std::string NumberOf(sb4 sqlcode) {
    const long long number = sqlcode == 100 ? 1403 : std::llabs(sqlcode);
    std::string digits = std::to_string(number);
    if (digits.size() < 5) digits.insert(0, 5 - digits.size(), '0');
    return "ORA-" + digits;
}

// Both with ": " between them, or the one that is there.
std::string Joined(std::string_view left, std::string_view right) {
    std::string text(left);
    if (!left.empty() && !right.empty()) text += ": ";
    return text.append(right);
}

}  // namespace

std::size_t SqlcaMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* catalogue,
                             const SQLCA& diagnostics) {
    std::string text;
    if (diagnostics.sqlcode != 0) {
        const std::string number = NumberOf(diagnostics.sqlcode);
        text = Joined(number, MessageCatalogue(catalogue).Find(number));
    }
    return CopyInLines(Joined(text, Words(diagnostics)), buffer, capacity, line_width);
}

std::size_t SqlstateMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* catalogue,
                                const char* sqlstate) {
    const std::string code(sqlstate, strnlen(sqlstate, sizeof(SQLCA::sqlstate)));
    std::string text;
    if (code.size() == sizeof(SQLCA::sqlstate)) {
        const MessageCatalogue texts(catalogue);
        std::string_view meaning = texts.Find("SQLSTATE " + code);
        if (meaning.empty()) meaning = texts.Find("SQLSTATE " + code.substr(0, 2));
        if (!meaning.empty()) text = Joined(code, meaning);
    }
    return CopyInLines(text, buffer, capacity, line_width);
}
