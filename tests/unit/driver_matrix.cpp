// Every command of the table that has a handler, called on the real client library with good words, "null", "invalid",
// unknown names and senseless numbers in every place. The process must live, under the sanitizers too; a wrong word count
// must print the usage text and nothing else.
#include <gtest/gtest.h>

#include <cctype>
#include <cstring>
#include <filesystem>
#include <map>
#include <sstream>
#include <string>
#include <vector>

#include "core/dispatch.h"
#include "core/tokenizer.h"
#include "objects/library_failure.h"
#include "objects/registry.h"
#include "report/return_code.h"

namespace {

constexpr int kMostWords = 14;

using Words = std::vector<std::string>;

// Dispatches the words from token buffers, as the loop does, and returns what is printed.
std::string Perform(const Words& words) {
    static TokenVector tokens;
    for (size_t index = 0; index < words.size(); ++index)
        tokens.StrAllocAndCopy(static_cast<int>(index), words[index].c_str());
    testing::internal::CaptureStdout();
    Dispatch(static_cast<int>(words.size()), tokens.Words());
    return testing::internal::GetCapturedStdout();
}

void RunLine(const std::string& line) {
    std::istringstream text(line);
    Words words;
    for (std::string word; text >> word;) words.push_back(word);
    Perform(words);
}

// One object of each kind under the name that GoodWord gives for it.
void MakeObjects() {
    const char* const lines[] = {
        "quickconnectoci env err svc :memory:",
        "ocihandlealloc env stmt oci_htype_stmt",
        "ocihandlealloc env server oci_htype_server",
        "ocihandlealloc env session oci_htype_session",
        "ocihandlealloc env trans oci_htype_trans",
        "ocihandlealloc env describe oci_htype_describe",
        "ocidescriptoralloc env lob oci_dtype_lob",
        "ocidescriptoralloc env result oci_dtype_rset",
        "ocidescriptoralloc env rowid oci_dtype_rowid",
        "ocidescriptoralloc env moment oci_dtype_datetime",
        "freememoci buffer",
        "getmemoci null buffer sqlt_str 100 2",
        "ocithreadmutexinit env err mutex",
        "ocithreadidinit env err tid",
        "ocithreadhndinit env err thnd",
    };
    for (const char* line : lines) RunLine(line);
}

// The names of the arguments in a usage text.
Words ArgumentNames(const std::string& usage) {
    std::string plain;
    for (const char character : usage)
        plain += std::strchr("[]{}|", character) != nullptr ? ' ' : static_cast<char>(std::tolower(character));
    std::istringstream text(plain);
    Words names;
    for (std::string name; text >> name;) names.push_back(name);
    return names;
}

// A word that fits an argument of that name.
std::string GoodWord(const std::string& name) {
    static const std::pair<const char*, const char*> kWords[] = {
        {"henv", "env"},       {"herror", "err"},      {"errhp", "err"},   {"hsvc", "svc"},     {"stmttext", "select"},
        {"stmt", "stmt"},      {"hserver", "server"},  {"session", "session"}, {"hlob", "lob"}, {"hresult", "result"},
        {"hrowid", "rowid"},   {"datetime", "moment"}, {"hdate", "moment"}, {"date", "2024-02-29"}, {"number", "12.5"},
        {"mem", "buffer"},     {"mutex", "mutex"},     {"tid", "tid"},     {"thnd", "thnd"},    {"mode", "oci_default"},
        {"handletype", "oci_htype_stmt"}, {"descriptortype", "oci_dtype_lob"}, {"c_type", "sqlt_int"},
    };
    for (const auto& [part, word] : kWords)
        if (name.find(part) != std::string::npos) return word;
    return "1";
}

class Matrix : public testing::TestWithParam<Command> {
protected:
    static void SetUpTestSuite() {
        report_library_failure = ReturnCodeReport;
        const auto directory = std::filesystem::temp_directory_path() / "harnix_matrix";
        std::filesystem::create_directories(directory);
        std::filesystem::current_path(directory);
        setenv("KELPCI_HOME", directory.c_str(), 1);
    }
    static Words AllOf(const char* command, int count, const std::string& word) {
        Words words(static_cast<size_t>(count), word);
        words[0] = command;
        return words;
    }
    // Runs the words; they must reach the handler.
    static void Call(const Words& words) {
        const std::string printed = Perform(words);
        EXPECT_EQ(printed.find("Case error"), std::string::npos) << testing::PrintToString(words);
    }
};

TEST_P(Matrix, LivesWithAnyWords) {
    const Command& command = GetParam();
    const CommandRow& row = *Handlers().Find(command.code)->row;
    const Words names = ArgumentNames(row.usage);
    const std::string word = command.word;
    const bool blocks = word == "ocithreadmutexacquire";  // with a good mutex, for ever at the second time
    const bool sleeps = word == "pause";
    for (int count = 1; count <= kMostWords; ++count) {
        if (!row.words.Has(count)) {
            EXPECT_EQ(Perform(AllOf(command.word, count, "null")), "Invalid Syntax: " + std::string(row.usage) + "\n");
            continue;
        }
        MakeObjects();
        for (const char* same : {"null", "invalid", "nobody", "", "1"}) Call(AllOf(command.word, count, same));
        Words good = AllOf(command.word, count, "1");
        for (size_t place = 1; place < good.size() && place < names.size() && !blocks; ++place)
            good[place] = GoodWord(names[place]);
        if (!sleeps) Call(good);
        for (size_t place = 1; place < good.size(); ++place)
            for (const char* odd : {"null", "invalid", "nobody", "-1", "0", "99999", "4294967295", ""}) {
                if (sleeps && std::isdigit(static_cast<unsigned char>(odd[0])) != 0) continue;
                Words words = good;
                words[place] = odd;
                Call(words);
            }
    }
}

std::vector<Command> HandledCommands() {
    std::vector<Command> commands;
    for (const Command* command = kCommandTable; command->word != nullptr; ++command)
        if (Handlers().Find(command->code) != nullptr) commands.push_back(*command);
    return commands;
}

INSTANTIATE_TEST_SUITE_P(Commands, Matrix, testing::ValuesIn(HandledCommands()),
                         [](const auto& parameter) { return std::string(parameter.param.word); });

}  // namespace
