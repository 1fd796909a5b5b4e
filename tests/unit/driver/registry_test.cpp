// The tables of named objects, but for areas: capacities and messages written down by hand.
#include "objects/buffers.h"
#include "objects/registry.h"
#include "support/printed.h"

namespace {

int object_a;  // stands for what the library returned

TEST(Registry, CapacitiesAndMessages) {
    // A kind without the last word says nothing of a name in use.
    const struct { Kind kind; int capacity; std::string overflow, in_use; } cases[] = {
        {Kind::environment, 30, "environment", "Environment"}, {Kind::error, 30, "error", "Error"},
        {Kind::svc, 800, "svc", "Svc"}, {Kind::server, 800, "server", "Server"},
        {Kind::session, 800, "session", "Session"}, {Kind::trans, 800, "trans", "Trans"},
        {Kind::spool, 800, "spool", "SPool"}, {Kind::cpool, 800, "cpool", "SPool"}, {Kind::stmt, 650, "stmt", "Stmt"},
        {Kind::describe, 650, "describe", "Describe"}, {Kind::bind, 256, "bind", "Bind"},
        {Kind::define, 256, "define", "Define"}, {Kind::param, 100, "param", ""}, {Kind::lob, 650, "lob", "Lob"},
        {Kind::result, 650, "lob", "Result"}, {Kind::rowid, 650, "rowid", "Rowid"}, {Kind::file, 650, "file", "File"},
        {Kind::datetime, 650, "datetime", "Datetime"}, {Kind::string, 650, "string", ""}, {Kind::raw, 650, "raw", ""},
        {Kind::mutex, 650, "mutex", "Mutex"}, {Kind::key, 650, "key", "Key"}, {Kind::tid, 650, "tid", "tid"},
        {Kind::thnd, 650, "thnd", "thnd"}};
    for (const auto& c : cases) {
        const auto name = [](int number) { return "n" + std::to_string(number); };
        for (int number = 0; number < c.capacity; ++number)
            ASSERT_NE(Register(c.kind, name(number).c_str(), &object_a, nullptr), nullptr) << c.overflow << number;
        EXPECT_EQ(Printed([&] { EXPECT_EQ(Register(c.kind, "one more", &object_a, nullptr), nullptr); }),
                  "Reached max " + c.overflow + " handle count - " + std::to_string(c.capacity) + "\n");
        EXPECT_EQ(Printed([&] { EXPECT_TRUE(CheckInUse(c.kind, "n0")); }),
                  c.in_use.empty() ? "" : "*** " + c.in_use + " handle already in use\n");
        EXPECT_EQ(Printed([&] { EXPECT_FALSE(CheckInUse(c.kind, "one more")); }), "");
        for (int number = 0; number < c.capacity; ++number) Release(c.kind, name(number).c_str());
        EXPECT_EQ(FindByName(c.kind, "n0"), nullptr) << c.overflow;
    }
    static MemBuffer slots[2];
    EXPECT_EQ(Printed([] { while (OccupySlot(Kind::buffer, std::span<MemBuffer>(slots), "b") != nullptr) {} }),
              "Reached max buffer handle count - 256\n");
}

}  // namespace
