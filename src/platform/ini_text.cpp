// Reading and changing the text of an INI file. Any thread.
#include "platform/ini_text.h"

#include <strings.h>

#include <algorithm>
#include <cctype>
#include <unordered_set>

namespace {

constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";

bool Same(std::string_view left, std::string_view right) {
    return left.size() == right.size() && strncasecmp(left.data(), right.data(), left.size()) == 0;
}

// Equal for what is the same name.
std::string Folded(std::string name) {
    for (char& character : name) character = static_cast<char>(std::tolower(static_cast<unsigned char>(character)));
    return name;
}

std::string_view Trimmed(std::string_view text) {
    constexpr std::string_view kBlanks = " \t";
    const std::size_t first = text.find_first_not_of(kBlanks);
    if (first == text.npos) return {};
    return text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

}  // namespace

IniText::IniText(std::string_view text) {
    std::string section;
    while (!text.empty()) {
        const std::size_t feed = text.find('\n');
        std::string_view whole = text.substr(0, feed == text.npos ? text.size() : feed + 1);
        text.remove_prefix(whole.size());
        std::string_view content = whole;
        if (content.ends_with('\n')) content.remove_suffix(1);
        if (content.size() < whole.size() && content.ends_with('\r')) content.remove_suffix(1);

        Line line;
        line.text = content;
        line.end = whole.substr(content.size());
        if (lines_.empty() && !line.end.empty()) line_end_ = line.end;
        Understand(line, section);
        lines_.push_back(std::move(line));
    }
}

void IniText::Understand(Line& line, std::string& section) {
    std::string_view text = line.text;
    if (text.starts_with(kByteOrderMark)) text.remove_prefix(kByteOrderMark.size());
    text = Trimmed(text);
    const std::size_t close = text.find(']');
    const std::size_t equals = text.find('=');
    if (text.starts_with('[') && close != text.npos) section = Trimmed(text.substr(1, close - 1));
    const bool other = text.starts_with('[') || text.starts_with(';') || text.starts_with('#');
    line.section = section;
    if (other || equals == text.npos) return;
    line.key = Trimmed(text.substr(0, equals));
    line.value = Trimmed(text.substr(equals + 1));
}

const std::string* IniText::Find(std::string_view section, std::string_view key) const {
    for (const Line& line : lines_)
        if (!line.key.empty() && Same(line.section, section) && Same(line.key, key)) return &line.value;
    return nullptr;
}

std::vector<IniSetting> IniText::Settings(std::string_view section) const {
    std::vector<IniSetting> settings;
    std::unordered_set<std::string> known;
    for (const Line& line : lines_) {
        if (line.key.empty() || !Same(line.section, section)) continue;
        if (known.insert(Folded(line.key)).second) settings.push_back({line.key, line.value});
    }
    return settings;
}

void IniText::Set(std::string_view section, std::string_view key, std::string_view value) {
    for (Line& line : lines_) {
        if (!Same(line.section, section) || !Same(line.key, key)) continue;
        // What stands before the value is kept, blanks behind the equals sign too.
        const std::size_t equals = line.text.find('=');
        const std::size_t start = line.text.find_first_not_of(" \t", equals + 1);
        line.text.resize(start == line.text.npos ? line.text.size() : start);
        line.text += value;
        line.value = value;
        return;
    }
    std::size_t index = InsertionPoint(section);
    if (index == 0) {
        if (!lines_.empty()) Insert(lines_.size(), "");
        Insert(lines_.size(), '[' + std::string(section) + ']');
        index = lines_.size();
    }
    Insert(index, std::string(key) + '=' + std::string(value));
}

bool IniText::Remove(std::string_view section, std::string_view key) {
    return std::erase_if(lines_, [&](const Line& line) {
               return Same(line.section, section) && Same(line.key, key);
           }) > 0;
}

// Behind the last line of the section that is not empty; 0 when there is no such section.
std::size_t IniText::InsertionPoint(std::string_view section) const {
    for (std::size_t index = lines_.size(); index > 0; --index)
        if (Same(lines_[index - 1].section, section) && !Trimmed(lines_[index - 1].text).empty()) return index;
    return 0;
}

void IniText::Insert(std::size_t index, std::string text) {
    if (index > 0 && lines_[index - 1].end.empty()) lines_[index - 1].end = line_end_;
    Line line;
    line.text = std::move(text);
    line.end = line_end_;
    std::string section = index > 0 ? lines_[index - 1].section : "";
    Understand(line, section);
    lines_.insert(lines_.begin() + static_cast<std::ptrdiff_t>(index), std::move(line));
}

std::string IniText::Text() const {
    std::string text;
    for (const Line& line : lines_) text.append(line.text).append(line.end);
    return text;
}
