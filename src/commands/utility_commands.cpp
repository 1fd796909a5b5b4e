// Options, the client's INI file, removing a file, the locale, pausing. No command here calls the library. Most usage
// texts end in a line feed of their own, so that an empty line follows them. Command thread only.
#include <clocale>
#include <cstdio>
#include <cstring>
#include <vector>

#include "commands/families.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "core/state.h"
#include "objects/memory.h"
#include "platform/ini.h"
#include "platform/numbers.h"

namespace {

bool BeginsWith(const char* word, const char* beginning) {
    return std::strncmp(word, beginning, std::strlen(beginning)) == 0;
}

// --- Options ---------------------------------------------------------------------------------------------------------

// Options are only ever switched on, and whatever is not understood passes in silence.
void SetOption(const CommandRow&, int count, char** words) {
    if (count == 3 && BeginsWith(words[1], "REPLACEPWD") && password_given) replace_password = true;
    if (count == 2 && BeginsWith(words[1], "PRINTSQLFUNCTIONCODE")) print_sql_function_code = true;
}

// --- The INI file ----------------------------------------------------------------------------------------------------

constexpr char kIniFile[] = "kelpcli.ini";
constexpr char kIniSection[] = "kelpci";
constexpr size_t kIniRoom = 65000;

void PrintSetting(const char* key, const char* value) {
    if (*value == '\0') Message(kOutput, "%s not set\n", key);
    else Message(kOutput, "%s=%.*s\n", key, static_cast<int>(kIniRoom - 1), value);
}

void ReadAndPrintSetting(const char* key) {
    const Memory<char> value(static_cast<char*>(GetMem(kIniRoom)));
    if (value == nullptr) return;
    IniReadString(kIniFile, kIniSection, key, "", value.get(), kIniRoom);
    PrintSetting(key, value.get());
}

// As many as there would be room for the keys of: logs have no more.
void PrintAllSettings() {
    const std::vector<IniSetting> settings = IniReadSection(kIniFile, kIniSection, kIniRoom);
    if (settings.empty()) Message(kOutput, "No sections found\n");
    for (const IniSetting& setting : settings) PrintSetting(setting.key.c_str(), setting.value.c_str());
}

// The one complaint about a word count that goes to the output stream.
void ReadIni(const CommandRow& row, int count, char** words) {
    if (count > 2) return Message(kOutput, "Invalid Syntax: %s\n", row.usage);
    if (count == 2) ReadAndPrintSetting(words[1]);
    else PrintAllSettings();
}

void WriteIni(const CommandRow&, int count, char** words) {
    IniWriteString(kIniFile, kIniSection, words[1], count == 3 ? words[2] : nullptr);
}

// --- Surroundings ----------------------------------------------------------------------------------------------------

// Said of a file that was not there, too.
void DeleteFile(const CommandRow&, int, char** words) {
    static_cast<void>(std::remove(words[1]));
    Message(kOutput, "File %s removed\n", words[1]);
}

// The C library's category. What is none of ours is none of its either.
int CategoryOf(const char* word) {
    constexpr int kCategories[] = {LC_ALL, LC_COLLATE, LC_CTYPE, LC_MONETARY, LC_NUMERIC, LC_TIME};
    const int category = DecodeKeyword(word, LocaleCategoryKeywords);
    return category == kNotFound ? kNotFound : kCategories[category];
}

void SetLocale(const CommandRow&, int, char** words) {
    const int category = CategoryOf(words[1]);
    const char* locale = IsNull(words[2]) ? nullptr : words[2];
    if (SameIgnoringCase(words[2], "en_US")) locale = "american";
    const char* answer = std::setlocale(category, locale);
    if (answer == nullptr) return Message(kOutput, "setlocale failed\n");
    Message(kOutput, locale == nullptr ? "Current locale is not null\n" : "setlocale succeeded\n");
}

// Its complaint begins in words of its own.
void Pause(const CommandRow& row, int count, char** words) {
    if (count != 2) return Message(kError, "Syntax Error: %s\n", row.usage);
    SleepMilliseconds(DecodeLong(words[1]));
}

void DebugMemory(const CommandRow&, int, char**) {}

constexpr PlainCommand kUtilityCommands[] = {
    {{Code::opt, kAnyWords, ""}, SetOption},
    {{Code::readini, kAnyWords, "ReadIni [keyword]\n"}, ReadIni},
    {{Code::writeini, Words(2, 3), "WriteIni keyword [value]\n"}, WriteIni},
    {{Code::deletefile, Words(2), "DeleteFile filename\n"}, DeleteFile},
    {{Code::setlocale, Words(3), "setlocale category locale\n"}, SetLocale},
    {{Code::pause, kAnyWords, "pause sleep_in_milliseconds"}, Pause},
    {{Code::memdebug, Words(1), "memDebug\n"}, DebugMemory},
};

}  // namespace

void AddUtilityCommands(HandlerTable& handlers) {
    handlers.Add(kUtilityCommands);
}
