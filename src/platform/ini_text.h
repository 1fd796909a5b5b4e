// The text of an INI file, taken apart into lines that keep every byte. Any thread.
#pragma once

#include <string>
#include <string_view>
#include <vector>

#include "platform/ini.h"

class IniText {
public:
    explicit IniText(std::string_view text);

    // Null when there is no such key.
    [[nodiscard]] const std::string* Find(std::string_view section, std::string_view key) const;
    // Each key once, as it is first written, with the value it has there.
    [[nodiscard]] std::vector<IniSetting> Settings(std::string_view section) const;

    // The key of these is not empty: lines that are no settings have an empty one.
    void Set(std::string_view section, std::string_view key, std::string_view value);
    // False when there was none.
    bool Remove(std::string_view section, std::string_view key);

    [[nodiscard]] std::string Text() const;

private:
    struct Line {
        std::string text;       // without its end
        std::string end;        // "\n", "\r\n", or nothing behind the last line
        std::string section;    // that the line is in; of a heading, the one it opens
        std::string key;        // empty for comments, headings and what is unknown
        std::string value;
    };

    static void Understand(Line& line, std::string& section);
    [[nodiscard]] std::size_t InsertionPoint(std::string_view section) const;
    void Insert(std::size_t index, std::string text);

    std::vector<Line> lines_;
    std::string line_end_ = "\n";    // of the first line that has one
};
