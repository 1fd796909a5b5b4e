// Runs every file of the directories named on the command line through the fuzz target, for compilers without a fuzzer.
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, size_t size);

int main(int count, char** arguments) {
    int replayed = 0;
    for (int index = 1; index < count; ++index)
        for (const auto& entry : std::filesystem::directory_iterator(std::filesystem::absolute(arguments[index]))) {
            std::ifstream file(entry.path(), std::ios::binary);
            const std::string input{std::istreambuf_iterator<char>(file), {}};
            LLVMFuzzerTestOneInput(reinterpret_cast<const unsigned char*>(input.data()), input.size());
            ++replayed;
        }
    std::fprintf(stderr, "%d inputs replayed\n", replayed);
    return replayed == 0;
}
