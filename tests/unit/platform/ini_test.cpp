// Settings: what is found, what a write changes and, above all, what it leaves alone.
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "platform/ini.h"

namespace {

using namespace std::string_literals;

class Ini : public testing::Test {
protected:
    Ini() {
        std::string name = std::filesystem::temp_directory_path() / "platform_ini.XXXXXX";
        home_ = mkdtemp(name.data());
        setenv("KELPCI_HOME", home_.c_str(), 1);
    }
    ~Ini() override {
        unsetenv("KELPCI_HOME");
        std::filesystem::remove_all(home_);
    }
    [[nodiscard]] std::filesystem::path File() const { return home_ / "kelpcli.ini"; }
    void Put(const std::string& content) const { std::ofstream(File(), std::ios::binary) << content; }
    [[nodiscard]] std::string Content() const {
        std::ostringstream content;
        content << std::ifstream(File(), std::ios::binary).rdbuf();
        return content.str();
    }
    static std::string Read(const char* section, const char* key, std::size_t capacity = 100) {
        std::vector<char> area(capacity, '?');
        const std::size_t length = IniReadString("kelpcli.ini", section, key, "none", area.data(), capacity);
        EXPECT_TRUE(length == capacity || area[length] == '\0');
        return std::string(area.data(), length);
    }
    static bool Write(const char* section, const char* key, const char* value) {
        return IniWriteString("kelpcli.ini", section, key, value);
    }

    std::filesystem::path home_;
};

TEST_F(Ini, AreasOfEveryLength) {
    Put("[s]\nkey=value\nother=1\n");
    for (std::size_t capacity = 0; capacity < 8; ++capacity)
        EXPECT_EQ(Read("s", "key", capacity), std::string("value").substr(0, capacity == 0 ? 0 : capacity - 1));
    const std::string keys = "key\0other\0"s;
    for (std::size_t capacity = 0; capacity < 14; ++capacity)
        EXPECT_EQ(Read("s", nullptr, capacity), capacity < 5 ? "" : keys.substr(0, capacity < 11 ? 4 : 10)) << capacity;
    Put("[s]\nempty=\n");
    EXPECT_EQ(Read("s", "absent") + Read("s", "empty"), "none");
    for (const std::size_t more : {0u, 1u}) {
        Put("[s]\nk=1\n" + std::string((16u << 20) - 8 + more, ';'));
        EXPECT_EQ(Read("s", "k"), more == 0 ? "1" : "none");
    }
}

TEST_F(Ini, AWriteChangesOneLine) {
    const struct { std::string before; const char* section; const char* key; const char* value; std::string after; }
    cases[] = {
        {"", "s", "k", "v", "[s]\nk=v\n"},
        {"; top\n[s]\nK  =  old\n; end\n", "S", "k", "new", "; top\n[s]\nK  =  new\n; end\n"},
        {"[s]\r\na=1\r\n\r\n[t]\r\nb=2", "s", "k", "v", "[s]\r\na=1\r\nk=v\r\n\r\n[t]\r\nb=2"},
        {"[s]\r\na=1\n", "s", "k", "v", "[s]\r\na=1\nk=v\r\n"}, {"[s]\r\na=1", "s", "k", "v", "[s]\r\na=1\r\nk=v\r\n"},
        {"[s]\na=1\n", "t", "k", "v", "[s]\na=1\n\n[t]\nk=v\n"}, {"[s]\n\n", "s", "k", "v", "[s]\nk=v\n\n"},
        {"[s]\nk=1\nk=2\n", "s", "k", "3", "[s]\nk=3\nk=2\n"},
        {"[s]\nk=1\nodd line\nk=2\n[t]\nk=3\n", "s", "K", nullptr, "[s]\nodd line\n[t]\nk=3\n"},
        {"[s]\nk=1\n", "s", "absent", nullptr, "[s]\nk=1\n"}, {"[s]\nk=\n", "s", "k", "v", "[s]\nk=v\n"},
        {"[s]", "s", "k", "v", "[s]\nk=v\n"}, {"[s\nk=1\n", "s", "k", "v", "[s\nk=1\n\n[s]\nk=v\n"},
        {" [s]\n ;k=0\nk=1\n", "s", "k", "", " [s]\n ;k=0\nk=\n"}, {"k=0\n[s]\n", "", "k", "1", "k=1\n[s]\n"}};
    for (const auto& c : cases) {
        Put(c.before);
        EXPECT_TRUE(Write(c.section, c.key, c.value));
        EXPECT_EQ(Content(), c.after);
    }
}

TEST_F(Ini, RefusesWhatCouldNotBeReadBack) {
    Put("[s]\nk=1\n");
    const struct { const char* section; const char* key; const char* value; } cases[] = {
        {"s", "", "v"}, {"s", nullptr, "v"}, {"s", "a=b", "v"}, {"s", "[a", "v"}, {"s", ";a", "v"}, {"s", " a", "v"},
        {"s", "a", "v\nb=1"}, {"s", "a\nb", "v"}, {"s]", "a", "v"}, {"s", "#", nullptr}, {"s", "a ", "v"},
        {" s", "a", "v"}, {"s\n", "a", "v"}};
    for (const auto& c : cases) EXPECT_FALSE(Write(c.section, c.key, c.value)) << (c.key ? c.key : "null");
    EXPECT_EQ(Content(), "[s]\nk=1\n");
}

TEST_F(Ini, AWriteKeepsPermissionsAndLinks) {
    std::ofstream(home_ / "real.ini") << "[s]\nk=1\n";
    chmod((home_ / "real.ini").c_str(), 0640);
    std::filesystem::create_symlink("real.ini", File());
    std::ofstream(home_ / "real.ini.new") << "left behind";
    EXPECT_TRUE(Write("s", "k", "2"));
    EXPECT_TRUE(std::filesystem::is_symlink(File()));
    EXPECT_EQ(Content(), "[s]\nk=2\n");
    struct stat status {};
    stat(File().c_str(), &status);
    EXPECT_EQ(status.st_mode & 0777, 0640u);
    EXPECT_FALSE(std::filesystem::exists(home_ / "real.ini.new"));
}

TEST_F(Ini, AFileThatCannotBeReadIsNotReplaced) {
    std::filesystem::create_directory(File());
    EXPECT_EQ(Read("s", "k"), "none");
    EXPECT_FALSE(Write("s", "k", "v"));
    EXPECT_TRUE(std::filesystem::is_directory(File()));
    std::filesystem::remove(File());
    EXPECT_TRUE(Write("s", "k", nullptr));
    EXPECT_FALSE(std::filesystem::exists(File()));
    std::filesystem::create_directory(File() += ".new");
    EXPECT_FALSE(Write("s", "k", "v"));
    std::filesystem::remove(File() += ".new");
    std::filesystem::create_symlink("kelpcli.ini", File());
    EXPECT_FALSE(Write("s", "k", "v"));
    EXPECT_TRUE(std::filesystem::is_symlink(File()));
    setenv("KELPCI_HOME", (home_ / "nowhere").c_str(), 1);
    EXPECT_FALSE(Write("s", "k", "v"));
    EXPECT_TRUE(IniWriteString((home_ / "own.ini").c_str(), "s", "k", "v"));
}

TEST_F(Ini, AWriteThatFindsNoRoomLeavesTheOldFile) {
    Put("[s]\nk=1\n");
    rlimit usual{};
    getrlimit(RLIMIT_FSIZE, &usual);
    const rlimit few{8, usual.rlim_max};
    std::signal(SIGXFSZ, SIG_IGN);
    setrlimit(RLIMIT_FSIZE, &few);
    EXPECT_FALSE(Write("s", "k", "22"));
    setrlimit(RLIMIT_FSIZE, &usual);
    EXPECT_EQ(Content(), "[s]\nk=1\n");
    EXPECT_FALSE(std::filesystem::exists(File() += ".new"));
}

TEST_F(Ini, WritersDoNotLoseEachOthersKeys) {
    std::vector<std::thread> writers;
    for (int writer = 0; writer < 4; ++writer)
        writers.emplace_back([writer] {
            for (int key = 0; key < 10; ++key)
                EXPECT_TRUE(Write("s", ("k" + std::to_string(writer * 10 + key)).c_str(), "v"));
        });
    for (std::thread& writer : writers) writer.join();
    for (int key = 0; key < 40; ++key) EXPECT_EQ(Read("s", ("k" + std::to_string(key)).c_str()), "v") << key;
}

}  // namespace
