// Wordings of SQLSTATEs, and texts in lines.
#include "platform/message_texts.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <string>
#include <string_view>

namespace {

struct Meaning {
    std::string_view code;    // five characters, or the two of a class
    std::string_view text;
};

constexpr Meaning kMeanings[] = {
    {"01", "warning"},
    {"02", "no data"},
    {"07", "dynamic SQL error"},
    {"08", "connection exception"},
    {"0A", "feature not supported"},
    {"21", "cardinality violation"},
    {"22", "data exception"},
    {"22001", "data exception: string data, right truncation"},
    {"22002", "data exception: null value, no indicator parameter"},
    {"22003", "data exception: numeric value out of range"},
    {"22008", "data exception: datetime field overflow"},
    {"22012", "data exception: division by zero"},
    {"22023", "data exception: invalid parameter value"},
    {"22024", "data exception: unterminated C string"},
    {"22025", "data exception: invalid escape sequence"},
    {"23", "integrity constraint violation"},
    {"24", "invalid cursor state"},
    {"25", "invalid transaction state"},
    {"26", "invalid SQL statement name"},
    {"28", "invalid authorization"},
    {"2D", "invalid transaction termination"},
    {"2E", "invalid connection name"},
    {"34", "invalid cursor name"},
    {"3D", "invalid catalog name"},
    {"3F", "invalid schema name"},
    {"40", "transaction rollback"},
    {"40001", "transaction rollback: serialization failure"},
    {"42", "syntax error or access rule violation"},
    {"44", "with check option violation"},
    {"60", "system error"},
    {"61", "resource error"},
    {"63", "path name or network error"},
    {"65", "stored procedure error"},
    {"66", "network error"},
    {"72", "error of the SQL executor"},
    {"HY", "general error"},
};

const Meaning* FindMeaning(std::string_view code) {
    const auto row = std::ranges::find(kMeanings, code, &Meaning::code);
    return row == std::end(kMeanings) ? nullptr : row;
}

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

}  // namespace

std::size_t SqlcaMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const SQLCA& diagnostics) {
    const std::string_view words = Words(diagnostics);
    if (diagnostics.sqlcode == 0 || !words.empty()) return CopyInLines(words, buffer, capacity, line_width);
    const long long number = std::llabs(diagnostics.sqlcode);
    std::string digits = std::to_string(number);
    if (digits.size() < 5) digits.insert(0, 5 - digits.size(), '0');
    return CopyInLines("ORA-" + digits, buffer, capacity, line_width);
}

std::size_t SqlstateMessageText(char* buffer, std::size_t capacity, std::size_t line_width, const char* sqlstate) {
    const std::string_view code(sqlstate, strnlen(sqlstate, sizeof(SQLCA::sqlstate)));
    const Meaning* meaning = FindMeaning(code);
    if (!meaning) meaning = FindMeaning(code.substr(0, 2));
    if (code.size() != sizeof(SQLCA::sqlstate) || !meaning) return CopyInLines("", buffer, capacity, line_width);
    return CopyInLines(std::string(code) + ": " + std::string(meaning->text), buffer, capacity, line_width);
}
