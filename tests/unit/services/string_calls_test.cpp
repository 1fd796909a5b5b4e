// The calls on strings, with what is none.
#include "support/call_fixture.h"

namespace {

using StringCalls = CallFixture;

// Nor is a text read whose length cannot be meant.
TEST_F(StringCalls, RefuseWhatIsNoString) {
    OCIString* string = nullptr;
    OCIRaw* raw = nullptr;
    for (const ub4 length : {kHuge, 0x10000001u})
        EXPECT_EQ(Answer(OCIStringAssignText(env_, err_, Text("x"), length, &string)), 22140) << length;
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
}

}  // namespace
