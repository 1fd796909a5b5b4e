// Whatever allocation fails: the call says so, nothing is lost, and the same handles serve the next call. Each scenario
// runs with its first allocation failing, then its second, and so on until nothing fails any more; with that one alone
// failing and with all from there on; the application's blocks and the library's own. Each run is on a new thread, so
// that its first step is the first call of a thread.
//
// To see all that is wrong, not the first only, set FAULTS_APART in the environment: each run is then a process of its
// own, and a crash is one line more.
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <iostream>
#include <thread>

#include "faults/world.h"

namespace faults {
namespace {

constexpr long kTooMany = 100000;

struct Case { Scenario scenario; Whose whose; How how; };

void PrintTo(const Case& c, std::ostream* out) { *out << c.scenario.name; }

std::string Described(const Plan& plan) {
    const std::string whose = plan.whose == Whose::application ? "the application's" : "the library's";
    const std::string how = plan.how == How::alone ? " alone (" : " and all that follow (";
    return whose + " allocation " + std::to_string(plan.at) + how + Seen().first + ")";
}

enum class End { whole, stopped };

End RunOnNewThread(const Scenario& scenario, World& world) {
    End end = End::whole;
    world.Begin();
    std::thread([&] {
        try {
            scenario.run(world);
        } catch (const Stopped&) {
            end = End::stopped;
        }
    }).join();
    return end;
}

// One plan and then the same again without a failure. False when the plan failed nothing.
bool RunAndAgain(const Scenario& scenario, World& world, const Plan& plan) {
    Set(plan);
    const End end = RunOnNewThread(scenario, world);
    const long failed = Seen().failed;
    SCOPED_TRACE(Described(plan));
    EXPECT_TRUE(end == End::whole || failed > 0) << "stopped, though no memory failed";
    if (end == End::whole) {
        EXPECT_EQ(world.seen, scenario.expected) << (failed ? "though memory failed" : "");
    }
    Set({});
    world.CheckKept();
    world.Reset();
    if (failed == 0) return false;
    EXPECT_EQ(RunOnNewThread(scenario, world), End::whole) << "again";
    EXPECT_EQ(world.seen, scenario.expected) << "again";
    world.Reset();
    return true;
}

// What is held when nothing should be.
struct Held {
    long blocks = ApplicationMemory::Blocks();
    sb4 counted = OCI_memGetMemCount();
    long long sqlite = SqliteBytes();
    bool operator==(const Held&) const = default;
};
void PrintTo(const Held& held, std::ostream* out) {
    *out << held.blocks << " of the application's blocks, " << held.counted << " by the library's count, "
         << held.sqlite << " bytes of SQLite's";
}

// On the server the engine's own memory fails alone: what libpq makes of it is libpq's.
Plan PlanOf(const Case& c, const World& world, long at) { return {c.whose, c.how, at, !world.OnServer()}; }

// Runs plans from the first on until one fails nothing, or something is wrong.
void RunPlans(const Case& c) {
    World world(c.scenario.ground, c.scenario.mode);
    if (c.scenario.prepare) c.scenario.prepare(world);
    long at = 1;
    while (at < kTooMany && !testing::Test::HasFailure() && RunAndAgain(c.scenario, world, PlanOf(c, world, at))) ++at;
    EXPECT_LT(at, kTooMany);
    std::cout << at - 1 << " allocations\n";
}

// The codes that the process of one plan ends with.
enum Code { kWrong = 1, kNothingFailed = 2 };

[[noreturn]] void RunOnePlanAndExit(const Case& c, long at) {
    const Held before;
    bool some = false;
    {
        World world(c.scenario.ground, c.scenario.mode);
        if (c.scenario.prepare) c.scenario.prepare(world);
        some = RunAndAgain(c.scenario, world, PlanOf(c, world, at));
    }
    EXPECT_EQ(Held().blocks, before.blocks);
    EXPECT_EQ(Held().counted, before.counted);
    std::fflush(nullptr);
    _exit((testing::Test::HasFailure() ? kWrong : 0) | (some ? 0 : kNothingFailed));
}

// Runs the same plans, each in a process of its own; all of them, whatever is wrong.
void RunPlansApart(const Case& c) {
    bool more = true;
    for (long at = 1; at < kTooMany && more; ++at) {
        const pid_t child = fork();
        if (child == 0) RunOnePlanAndExit(c, at);
        int status = 0;
        waitpid(child, &status, 0);
        EXPECT_TRUE(WIFEXITED(status)) << "signal " << WTERMSIG(status) << " at allocation " << at;
        EXPECT_TRUE(!WIFEXITED(status) || !(WEXITSTATUS(status) & kWrong)) << "at allocation " << at;
        more = !WIFEXITED(status) || !(WEXITSTATUS(status) & kNothingFailed);
    }
}

// Runs before all others: what the library makes once a process is made, and fails, in the processes begun here.
class FirstCalls : public testing::TestWithParam<Case> {};

TEST_P(FirstCalls, OfAProcess) {
    ASSERT_EQ(World::Made(), 0) << "the library is in use already";
    RunPlansApart(GetParam());
}

class Faults : public testing::TestWithParam<Case> {};

TEST_P(Faults, AtEachAllocation) {
    World(Ground::session, OCI_DEFAULT);    // what stays for the life of the process
    if (std::getenv("FAULTS_APART")) return RunPlansApart(GetParam());
    const Held before;
    RunPlans(GetParam());
    EXPECT_EQ(Held(), before);
}

std::vector<Case> Cases(bool first_calls_alone) {
    std::vector<Case> cases;
    for (const Scenario& scenario : AllScenarios()) {
        if (first_calls_alone && !scenario.first_calls) continue;
        for (const Whose whose : {Whose::application, Whose::library}) {
            for (const How how : {How::alone, How::from_then_on}) cases.push_back({scenario, whose, how});
        }
    }
    return cases;
}

std::string NameOf(const testing::TestParamInfo<Case>& info) {
    const Case& c = info.param;
    return std::string(c.scenario.name) + (c.whose == Whose::application ? "_Application" : "_Library") +
           (c.how == How::alone ? "_Alone" : "_FromThenOn");
}

INSTANTIATE_TEST_SUITE_P(Memory, FirstCalls, testing::ValuesIn(Cases(true)), NameOf);
INSTANTIATE_TEST_SUITE_P(Memory, Faults, testing::ValuesIn(Cases(false)), NameOf);

}  // namespace
}  // namespace faults
