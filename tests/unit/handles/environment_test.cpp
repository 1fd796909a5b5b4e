// Parameters of the library, lists of errors, and texts that end at a zero or their length.
#include <gtest/gtest.h>

#include <utility>

#include "describe/describe_handle.h"
#include "handles/attributes.h"
#include "handles/environment.h"
#include "oci.h"

namespace {

// What engines tell of sequences and synonyms, as attributes: numbers in the form that applications know, whatever form texts have.
TEST(Parameters, SequencesAndSynonyms) {
    Environment* const environment = Environment::Open(OCI_UTF16, Environment::SetsOf(OCI_UTF16), {}, 0);
    auto* const handle = Create<DescribeHandle>(*environment, OCI_HTYPE_DESCRIBE, 0);
    const auto get = [&](std::uint32_t attribute) -> std::string {
        void* parameter = nullptr;
        const char* text = nullptr;
        std::uint32_t size = 0;
        EXPECT_TRUE(handle->GetParameter(1, &parameter).Ok());
        const Status status = GetAttribute(*Live<Parameter>(parameter), &text, &size, attribute);
        return status.Ok() ? std::string(text, size) : std::to_string(status.Number());
    };
    engine::ObjectDescription object;
    object.kind = engine::ObjectKind::sequence;
    object.sequence_least = -7, object.sequence_most = 1234, object.sequence_step = 2, object.sequence_mark = 0;
    handle->Show(describe::DescribedObject(object, {}));
    const auto number = [](std::string_view bytes) { return std::string(bytes) + std::string(22 - bytes.size(), '\0'); };
    EXPECT_EQ(get(OCI_ATTR_MIN), number("\x03\x3e\x5e\x66"));
    EXPECT_EQ(get(OCI_ATTR_MAX), number("\x03\xc2\x0d\x23"));
    EXPECT_EQ(get(OCI_ATTR_INCR), number("\x02\xc1\x03"));
    EXPECT_EQ(get(OCI_ATTR_HW_MARK), number("\x01\x80"));
    EXPECT_EQ(get(OCI_ATTR_CACHE), "24315") << "not told";
    EXPECT_EQ(get(OCI_ATTR_LIST_COLUMNS), "24315");
    object = {};
    object.kind = engine::ObjectKind::synonym;
    object.name = "S", object.target = "T", object.target_schema = "MAIN";
    handle->Show(describe::DescribedObject(object, {}));
    EXPECT_EQ(get(OCI_ATTR_NAME), std::string("T\0", 2));
    EXPECT_EQ(get(OCI_ATTR_SCHEMA_NAME), std::string("M\0A\0I\0N\0", 8));
    EXPECT_EQ(get(OCI_ATTR_OBJ_NAME), std::string("S\0", 2));
    EXPECT_EQ(get(OCI_ATTR_LINK), "");
    Destroy(environment);
}

TEST(ErrorLists, KeepWhatIsAdded) {
    ErrorList list, other;
    list.Add(Error(1));
    list.Add(Error(942, "words"));
    list.Add(Error(1403));
    other.Add(Error(1017));
    other.TakeFrom(list);
    EXPECT_FALSE(list.At(1));
    const int numbers[] = {1, 942, 1403};
    for (std::size_t at = 1; at <= 3; ++at) EXPECT_EQ(other.At(at)->number, numbers[at - 1]);
    EXPECT_FALSE(other.At(0) || other.At(4));
}

// A length beyond a terminated text does no harm, nor does one within it.
TEST(TextIn, EndsAtAZeroOrItsLength) {
    const struct { std::uint32_t mode; std::string_view text; const char* read; } cases[] = {
        {OCI_DEFAULT, {"ab\0c", 4}, "ab"}, {OCI_DEFAULT, "ab\1c", "ab\1c"}, {OCI_DEFAULT, {"\0a", 2}, ""},
        {OCI_UTF16, {"a\0b\0\0\0", 6}, "ab"}, {OCI_UTF16, {"\0\1a\0", 4}, "\xC4\x80""a"},
        {OCI_UTF16, {"\0\0a\0", 4}, ""}, {OCI_UTF16, {"a\0b\0", 4}, "ab"}};
    for (const auto& c : cases) {
        Environment* const environment = Environment::Open(c.mode, Environment::SetsOf(c.mode), {}, 0);
        EXPECT_EQ(TextIn(*environment, c.text.data(), c.text.size()).View(), c.read);
        Destroy(environment);
    }
}

}  // namespace
