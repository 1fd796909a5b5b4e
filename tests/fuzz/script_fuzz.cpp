// Any bytes as a script. The driver must read them to the end without a sanitizer finding; what it prints is not looked
// at. No client library is loaded unless HARNIX_CLIENT_LIBRARY names one, so that the driver's own code is what runs.
//
//   cmake -B build/fuzz -DCMAKE_CXX_COMPILER=clang++ -DHARNIX_SANITIZE=address,undefined,fuzzer-no-link
//   cmake --build build/fuzz --target script_fuzz && build/fuzz/bin/script_fuzz "$PWD/tests/fuzz/corpus"
//
// A finding is mended and its input stays in the corpus, which a test replays.
#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <sstream>
#include <string>

#include "core/command_table.h"
#include "core/messages.h"
#include "loop/script.h"
#include "core/state.h"
#include "objects/buffers.h"
#include "objects/registry.h"

namespace {


// Once: away with the output, and into a directory that a script may fill and empty.
void Prepare() {
    static const bool done = [] {
        setenv("HARNIX_CLIENT_LIBRARY", "no library", 0);
        const auto directory = std::filesystem::temp_directory_path() / "harnix_fuzz";
        std::filesystem::create_directories(directory);
        std::filesystem::current_path(directory);
        setenv("KELPCI_HOME", directory.c_str(), 1);
        PrepareMessages();
        return std::freopen("/dev/null", "w", stdout) != nullptr;
    }();
    if (!done) std::abort();
}

bool Pauses(const std::string& script) {
    std::istringstream lines(script);
    for (std::string line; std::getline(lines, line);) {
        std::istringstream words(line);
        std::string word;
        if (!(words >> word)) continue;
        const Command* command = FindCommand(word.c_str());
        if (command != nullptr && command->code == Code::pause) return true;
    }
    return false;
}

// What one script leaves behind must not change what the next one does.
void ForgetObjects() {
    for (MemBuffer& buffer : Buffers()) {
        if (buffer.in_use) FreeBufferBlocks(buffer);
        buffer.in_use = false;
    }
    for (int kind = 0; kind <= static_cast<int>(Kind::thnd); ++kind)
        for (NamedObject& slot : SlotsOf(static_cast<Kind>(kind))) slot.in_use = false;
    Utf16Mode = false;
    report_switch = 1;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, size_t size) {
    Prepare();
    std::string script(reinterpret_cast<const char*>(data), size);
    std::ranges::replace(script, '/', '.');  // no name leads out of the directory
    if (script.empty() || Pauses(script)) return 0;
    std::FILE* stream = fmemopen(script.data(), script.size(), "r");
    if (stream == nullptr) return 0;
    ReadAndEvaluateScript(stream);
    std::fclose(stream);
    ForgetObjects();
    return 0;
}
