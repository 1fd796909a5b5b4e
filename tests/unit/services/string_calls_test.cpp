// The calls on strings and raws.
#include "support/call_fixture.h"

namespace {

class StringCalls : public CallFixture {
protected:
    std::string Contents(OCIString* string) {
        const auto* text = reinterpret_cast<const char*>(OCIStringPtr(env_, string));
        return text ? std::string(text, OCIStringSize(env_, string)) : "(null)";
    }
};

TEST_F(StringCalls, AStringLivesThroughAssignmentsAndSizes) {
    OCIString* string = nullptr;
    ASSERT_EQ(OCIStringAssignText(env_, err_, Text("hello"), 5, &string), OCI_SUCCESS);
    OCIString* const first = string;
    EXPECT_EQ(Contents(string), "hello");
    EXPECT_EQ(OCIStringPtr(env_, string)[5], 0);
    ASSERT_EQ(OCIStringAssignText(env_, err_, Text("a much longer text"), 18, &string), OCI_SUCCESS);
    ASSERT_EQ(OCIStringAssignText(env_, err_, Text("bye"), 3, &string), OCI_SUCCESS);
    EXPECT_EQ(string, first) << "assigned in place";
    EXPECT_EQ(Contents(string), "bye");
    EXPECT_EQ(std::string_view(reinterpret_cast<char*>(OCIStringPtr(env_, string)), 5), std::string_view("bye\0\0", 5));
    OCIString* copy = nullptr;
    for (int times = 0; times < 2; ++times) {
        ASSERT_EQ(OCIStringAssign(env_, err_, string, &copy), OCI_SUCCESS);
        EXPECT_EQ(Contents(copy), "bye");
        ASSERT_EQ(OCIStringAssignText(env_, err_, Text("other"), 5, &copy), OCI_SUCCESS);
    }
    for (const ub4 room : {2u, 100u}) {
        ASSERT_EQ(OCIStringResize(env_, err_, room, &string), OCI_SUCCESS);
        EXPECT_EQ(Contents(string), "by");
        ub4 size = 0;
        EXPECT_EQ(OCIStringAllocSize(env_, err_, string, &size), OCI_SUCCESS);
        EXPECT_EQ(size, room);
    }
    ASSERT_EQ(OCIStringResize(env_, err_, 0, &string), OCI_SUCCESS);
    EXPECT_EQ(string, nullptr);
    EXPECT_EQ(OCIStringPtr(env_, first), nullptr);
}

TEST_F(StringCalls, RefuseWhatIsNoString) {
    OCIString* string = nullptr;
    OCIRaw* raw = nullptr;
    ASSERT_EQ(OCIStringAssignText(env_, err_, Text("x"), 1, &string), OCI_SUCCESS);
    ASSERT_EQ(OCIRawAssignBytes(env_, err_, Text("x"), 1, &raw), OCI_SUCCESS);
    ub4 size = 0;
    auto* other_kind = reinterpret_cast<OCIString*>(raw);
    for (OCIString* wrong : {Bogus<OCIString>(), other_kind, reinterpret_cast<OCIString*>(env_)}) {
        OCIString* target = wrong;
        EXPECT_EQ(OCIStringAssignText(env_, err_, Text("y"), 1, &target), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringAssign(env_, err_, string, &target), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringAssign(env_, err_, wrong, &string), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringResize(env_, err_, 5, &target), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringResize(env_, err_, 0, &target), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringAllocSize(env_, err_, wrong, &size), OCI_INVALID_HANDLE);
        EXPECT_EQ(OCIStringPtr(env_, wrong), nullptr);
        EXPECT_EQ(OCIStringSize(env_, wrong), 0u);
        EXPECT_EQ(target, wrong);
    }
    EXPECT_EQ(OCIStringPtr(nullptr, string), nullptr);
    EXPECT_EQ(OCIRawSize(nullptr, raw), 0u);
}

// A length that cannot be meant is refused before anything is read.
TEST_F(StringCalls, HugeLengths) {
    OCIString* string = nullptr;
    for (const ub4 length : {0xFFFFFFFFu, 0x80000000u, 0x10000001u}) {
        EXPECT_EQ(Answer(OCIStringAssignText(env_, err_, Text("x"), length, &string)), 22140) << length;
        EXPECT_EQ(Answer(OCIStringResize(env_, err_, length, &string)), 22140) << length;
        EXPECT_EQ(string, nullptr);
    }
}

}  // namespace
