// What a user of the driver would notice, each beside the same work done by hand (baselines.cpp) in the same run: lines
// interpreted, rows fetched and printed, start-up, memory over a long script. Prints a line a measure: the median of
// the paired ratios and the goal.
//   driver_bench BIN_DIR [runs]
#include <fcntl.h>
#include <spawn.h>
#include <sqlite3.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <stdexcept>
#include <string>
#include <vector>

extern char** environ;

namespace {

namespace fs = std::filesystem;
using Command = std::vector<std::string>;

struct Bench {
    fs::path binaries;
    fs::path folder;
    int runs = 5;
};

[[noreturn]] void Fail(const std::string& what) { throw std::runtime_error(what); }

// Runs a command with its input from a file and its output to a file, as a user keeps a log; answers the seconds.
double Seconds(const Command& command, const fs::path& input, const fs::path& output) {
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_addopen(&actions, 0, input.c_str(), O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions, 1, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC, 0644);
    std::vector<char*> words;
    for (const std::string& word : command) words.push_back(const_cast<char*>(word.c_str()));
    words.push_back(nullptr);
    const auto start = std::chrono::steady_clock::now();
    pid_t child = 0;
    if (posix_spawn(&child, words[0], &actions, nullptr, words.data(), environ) != 0)
        Fail("cannot start " + command[0]);
    int status = 0;
    waitpid(child, &status, 0);
    const auto end = std::chrono::steady_clock::now();
    posix_spawn_file_actions_destroy(&actions);
    if (status != 0) Fail(command[0] + " did not end well");
    return std::chrono::duration<double>(end - start).count();
}

double Median(std::vector<double> values) {
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

void Report(const char* what, double ratio, double goal) {
    std::printf("%-58s %6.2f x  (goal %.2f)\n", what, ratio, goal);
    std::fflush(stdout);
}

struct Side {
    Command command;
    fs::path input;
};

// Runs both in turn, after one run each to warm up, and reports the median of the ratios pair by pair.
void Pair(const Bench& bench, const char* what, double goal, const Side& ours, const Side& theirs) {
    const fs::path log = bench.folder / "log";
    Seconds(ours.command, ours.input, log);
    Seconds(theirs.command, theirs.input, log);
    std::vector<double> ratios;
    for (int run = 0; run < bench.runs; ++run) {
        const double mine = Seconds(ours.command, ours.input, log);
        ratios.push_back(mine / Seconds(theirs.command, theirs.input, log));
    }
    Report(what, Median(ratios), goal);
}

fs::path Script(const Bench& bench, const char* name, const std::function<void(std::ofstream&)>& write) {
    const fs::path path = bench.folder / name;
    std::ofstream out(path);
    write(out);
    return path;
}

fs::path Repeated(const Bench& bench, const char* name, const std::string& before, const std::string& line, int count) {
    return Script(bench, name, [&](std::ofstream& out) {
        out << before;
        for (int i = 0; i < count; ++i) out << line << '\n';
    });
}

// 200,000 rows of five columns, made by the engine itself.
void MakeTable(const fs::path& file) {
    sqlite3* database = nullptr;
    const char* sql =
        "create table t(id integer, price number(12,2), name varchar2(20), day date, note varchar2(40));"
        "with recursive n(i) as (select 1 union all select i + 1 from n where i < 200000)"
        "insert into t select i, i * 1.25, printf('name of row %08d', i),"
        "datetime('2026-01-01', '+' || (i % 3650) || ' days'),"
        "case when i % 3 = 0 then null else 'a note for row ' || i end from n";
    char* error = nullptr;
    if (sqlite3_open(file.c_str(), &database) != SQLITE_OK ||
        sqlite3_exec(database, sql, nullptr, nullptr, &error) != SQLITE_OK)
        Fail(error ? error : "cannot make the table");
    sqlite3_close(database);
}

long ResidentKilobytes(pid_t process) {
    std::ifstream status("/proc/" + std::to_string(process) + "/status");
    for (std::string word; status >> word;)
        if (word == "VmRSS:") {
            long kilobytes = 0;
            status >> kilobytes;
            return kilobytes;
        }
    Fail("no VmRSS");
}

void WriteAll(int descriptor, const std::string& text) {
    for (size_t done = 0; done < text.size();) {
        const ssize_t written = write(descriptor, text.data() + done, text.size() - done);
        if (written <= 0) Fail("the driver stopped reading");
        done += static_cast<size_t>(written);
    }
}

// Feeds the driver and waits until it ran all of it: the last command deletes a file.
void Feed(int descriptor, const std::string& commands, const fs::path& mark) {
    std::ofstream(mark) << "here\n";
    WriteAll(descriptor, commands + "deletefile " + mark.string() + "\n");
    for (int tries = 0; fs::exists(mark); ++tries) {
        if (tries > 60000) Fail("the driver did not finish what it was fed");
        usleep(10000);
    }
}

std::string MixedCommands(int count) {
    static const char* const kMixed[] = {
        "# a comment", "setcallerroroci 1", "getmemoci null buf sqlt_str 20 10", "updatememoci buf 3 text 4",
        "listoci null buf", "freememoci buf", "ocihandlealloc env stmt oci_htype_stmt",
        "ocistmtprepare stmt err \"select :a from dual\" 19 oci_ntv_syntax oci_default",
        "ocihandlefree stmt oci_htype_stmt", "ocihandlefree nothing oci_htype_stmt", "ociping svc err oci_default",
        "ocinumberadd err 12 30", "nonsense"};
    std::string text;
    for (int i = 0; i < count; ++i) text.append(kMixed[static_cast<size_t>(i) % std::size(kMixed)]).append("\n");
    return text;
}

void Memory(const Bench& bench) {
    const fs::path mark = bench.folder / "mark";
    int ends[2];
    if (pipe(ends) != 0) Fail("no pipe");
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, ends[0], 0);
    posix_spawn_file_actions_addclose(&actions, ends[1]);
    posix_spawn_file_actions_addopen(&actions, 1, "/dev/null", O_WRONLY, 0);
    const std::string program = bench.binaries / "harnix";
    char* words[] = {const_cast<char*>(program.c_str()), nullptr};
    pid_t child = 0;
    if (posix_spawn(&child, words[0], &actions, nullptr, words, environ) != 0) Fail("cannot start " + program);
    posix_spawn_file_actions_destroy(&actions);
    close(ends[0]);

    Feed(ends[1], "quickconnectoci env err svc :memory:\n" + MixedCommands(1000), mark);
    const long before = ResidentKilobytes(child);
    for (int batch = 0; batch < 100; ++batch) Feed(ends[1], MixedCommands(10000), mark);
    const long after = ResidentKilobytes(child);
    close(ends[1]);
    waitpid(child, nullptr, 0);
    std::printf("%-58s %6.2f MB (goal below 8)\n", "growth over one million mixed commands",
                static_cast<double>(after - before) / 1024.0);
}

void Run(const Bench& bench) {
    const std::string harnix = bench.binaries / "harnix";
    const std::string baselines = bench.binaries / "baselines";
    const fs::path nothing = Script(bench, "nothing", [](std::ofstream&) {});
    const int million = 1000000;

    const fs::path comments =
        Repeated(bench, "comments", "", "# a comment line of a script, as long as such lines are", million);
    Pair(bench, "one million comment lines / read, prompt, echo", 1.3, {{harnix}, comments},
         {{baselines, "echo"}, comments});

    const fs::path switches = Repeated(bench, "switches", "", "setcallerroroci 1", million);
    Pair(bench, "one million setcallerroroci / read, prompt, echo, result", 1.5, {{harnix}, switches},
         {{baselines, "result"}, switches});

    const char* const make_error_handle = "ocienvcreate env oci_default\nocihandlealloc env err oci_htype_error\n";
    const fs::path sums = Repeated(bench, "sums", make_error_handle, "ocinumberadd err 12 30", million);
    Pair(bench, "one million ocinumberadd / the same writes", 2.0, {{harnix}, sums}, {{baselines, "trace"}, sums});

    const fs::path file = bench.folder / "rows.db";
    MakeTable(file);
    const fs::path fetch = Script(bench, "fetch", [&](std::ofstream& out) {
        out << "quickconnectoci env err svc " << file.string() << "\nocihandlealloc env stmt oci_htype_stmt\n"
            << "ocistmtprepare stmt err \"select id, price, name, day, note from t\" 41 oci_ntv_syntax oci_default\n"
            << "ocistmtexecute svc stmt err 0 0 oci_default\nfetchalloci stmt\n";
    });
    Pair(bench, "FetchAllOCI of 200,000 x 5 / bare engine loop", 1.25, {{harnix}, fetch},
         {{baselines, "sqlite", file}, nothing});

    Bench often = bench;
    often.runs = 101;
    Pair(often, "start to first prompt / an empty program", 3.0, {{harnix}, nothing},
         {{bench.binaries / "empty"}, nothing});
    Memory(bench);
}

}  // namespace

int main(int argc, char** argv) try {
    if (argc < 2) Fail("usage: driver_bench BIN_DIR [runs]");
    char folder[] = "/tmp/harnix-bench-XXXXXX";
    if (!mkdtemp(folder)) Fail("no temporary folder");
    Bench bench{argv[1], folder};
    if (argc > 2) bench.runs = std::max(1, std::atoi(argv[2]));
    setenv("KELPCI_HOME", folder, 1);
    Run(bench);
    fs::remove_all(folder);
    return 0;
} catch (const std::exception& failure) {
    std::fprintf(stderr, "driver_bench: %s\n", failure.what());
    return 1;
}
