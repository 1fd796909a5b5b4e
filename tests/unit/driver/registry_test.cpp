// The tables of named objects: capacities and messages written down by hand, names, arrays, reserved words.
#include <cstring>

#include "objects/areas.h"
#include "objects/buffers.h"
#include "objects/registry.h"
#include "support/printed.h"

namespace {

int object_a, object_b;  // stand for what the library returned

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

Cda_Def* EnterArea(Kind kind, const std::string& name, Lda_Def* parent = nullptr) {
    NewArea area(kind, name.c_str());
    if (!area.Make()) return nullptr;
    Cda_Def* const made = area.Area();
    area.Enter(parent);
    return made;
}

TEST(Registry, AreasStayWhereTheyAreUntilTheyAreReleased) {
    Cda_Def* cursor = nullptr;
    for (const auto& pair : {std::pair{Kind::cursor, "cursor"}, {Kind::ldainfo, "ldainfo"}}) {
        const auto kind = pair.first;
        const char* const word = pair.second;
        for (int number = 0; number < 30; ++number) EnterArea(kind, "n" + std::to_string(number));
        EXPECT_EQ(Printed([&] { EXPECT_NE(EnterArea(kind, "one more"), nullptr); }),
                  std::string("Reached max ") + word + " count - 30\n");
        EXPECT_EQ(FindSlot(Areas(kind), "one more"), nullptr) << word;
    }
    const AreaArgument login = ResolveArea(Kind::ldainfo, "n7");
    EXPECT_EQ(Printed([] { EXPECT_EQ(EnterArea(Kind::ldainfo, "n7"), nullptr); }), "lda already in use\n");
    EXPECT_EQ(Printed([&] { cursor = EnterArea(Kind::cursor, "n8", login.area); }), "");
    const AreaArgument found = ResolveArea(Kind::cursor, "n8");
    EXPECT_EQ(found.area, cursor);
    EXPECT_EQ(found.slot->parent, login.area);
    ReleaseArea(*login.slot);
    EXPECT_TRUE(found.slot->in_use);
    EXPECT_EQ(found.slot->parent, nullptr) << "its login is gone";
    EXPECT_EQ(Printed([] { EXPECT_EQ(ResolveArea(Kind::ldainfo, "n7").area, nullptr); }), "Handle n7 not found\n");
    for (const Kind kind : {Kind::cursor, Kind::ldainfo})
        for (NamedArea& slot : Areas(kind)) if (slot.in_use) ReleaseArea(slot);
}

TEST(Registry, NamesAreCutToTheSlot) {
    const std::string long_name(40, 'n');
    const struct { Kind kind; size_t kept; } cases[] = {{Kind::stmt, 31}, {Kind::lob, 31}, {Kind::spool, 35}};
    for (const auto& c : cases) {
        NamedObject* slot = Register(c.kind, long_name.c_str(), &object_a, nullptr);
        EXPECT_EQ(slot->name, long_name.substr(0, c.kept));
        EXPECT_EQ(ResolveObject(c.kind, long_name.c_str()), &object_a);
        EXPECT_EQ(ResolveObject(c.kind, (long_name.substr(0, c.kept) + "another end").c_str()), &object_a);
        EXPECT_EQ(Printed([&] { ResolveObject(c.kind, long_name.substr(0, c.kept - 1).c_str()); }),
                  "Handle " + long_name.substr(0, c.kept - 1) + " not found\n");
        Release(c.kind, long_name.c_str());
    }
}

TEST(Registry, AnIndexSelectsFromAnArrayOfDescriptors) {
    void* array[] = {&object_a, &object_b};
    AsRecord<Kind::lob>(Register(Kind::lob, "arr", array, nullptr))->array_count = 2;
    Register(Kind::lob, "one", &object_b, nullptr);
    const struct { const char* word; void* object; bool is_array; long index; } cases[] = {
        {"arr[0]", &object_a, false, 0}, {"arr[1]", &object_b, false, 1}, {"arr[2]", array, true, 2},
        {"arr", array, true, 0}, {"arr[-1]", array, true, -1}, {"arr[1x", &object_b, false, 1},
        {"arr[]", &object_a, false, 0}, {"one[5]", &object_b, false, 5}, {"one", &object_b, false, 0},
        {"invalid", InvalidObject(), false, 0}};
    for (const auto& c : cases) {
        const DescriptorReference found = ResolveDescriptor(Kind::lob, c.word);
        EXPECT_EQ(found.object, c.object) << c.word;
        EXPECT_EQ(found.is_array, c.is_array) << c.word;
        EXPECT_EQ(found.index, c.index) << c.word;
    }
    Release(Kind::lob, "arr");
    EXPECT_EQ(Register(Kind::lob, "after", &object_a, nullptr), &*SlotsOf(Kind::lob).begin());
    EXPECT_EQ(ResolveObject(Kind::lob, "after[0]"), &object_a) << "a single descriptor in the slot of an array";
    Release(Kind::lob, "after");
    EXPECT_EQ(Printed([] { ResolveObject(Kind::lob, "arr2[1]"); }), "Handle arr2 not found\n");
    EXPECT_EQ(Printed([] { ResolveObject(Kind::lob, "null[1]"); }), "");
    EXPECT_EQ(Printed([] { ResolveObject(Kind::stmt, "s[1]"); }), "Handle s[1] not found\n");
    Release(Kind::lob, "one");
}

}  // namespace
