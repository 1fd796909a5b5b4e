// Texts of error records, and texts put into the application's buffers.
#include <gtest/gtest.h>

#include <utility>

#include "describe/describe_handle.h"
#include "handles/attributes.h"
#include "handles/character_set.h"
#include "handles/environment.h"
#include "handles/error_handle.h"
#include "oci.h"
#include "platform/utf.h"

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

// Every number from which another state holds than before it.
TEST(ErrorTexts, States) {
    std::string changes, state = "HY000";
    for (int number = 0; number < 100000; ++number)
        if (std::exchange(state, SqlState(number)) != state) changes += std::to_string(number) + ' ' + state + ' ';
    EXPECT_EQ(changes,
        "0 00000 1 23000 2 HY000 18 61000 22 42000 23 61000 36 HY000 50 61000 69 HY000 100 63000 121 HY000 251 42000 "
        "252 HY000 370 60000 430 HY000 440 63000 570 HY000 600 60000 900 42000 1000 72000 1001 24000 1004 72000 "
        "1017 28000 1018 72000 1031 42000 1032 72000 1095 02000 1096 72000 1100 HY000 1400 23000 1401 22001 "
        "1402 44000 1403 02000 1404 72000 1405 22002 1406 22001 1407 23000 1408 72000 1410 24000 1411 72000 "
        "1422 21000 1423 72000 1424 22025 1426 22003 1427 21000 1428 72000 1438 22003 1439 72000 1453 25000 "
        "1454 72000 1455 22003 1456 72000 1457 22003 1458 72000 1476 22012 1477 72000 1479 22024 1481 72000 "
        "1490 42000 1494 HY000 1700 42000 1800 22008 1900 42000 2091 40000 2093 42000 2100 HY000 2140 42000 "
        "2290 23000 2300 HY000 2376 61000 2400 HY000 2420 42000 2425 HY000 3106 66000 3136 HY000 4020 61000 "
        "4040 42000 4060 HY000 4163 22023 4164 HY000 4165 22023 4166 HY000 6430 60000 6450 HY000 6500 65000 "
        "6511 24000 6512 65000 6600 HY000 8006 24000 8007 HY000 8177 40001 8178 HY000 12100 66000 12600 HY000 "
        "12899 22001 12900 HY000 ");
    EXPECT_EQ(SqlState(-1), "HY000");
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
        {OCI_UTF16, {"a\0b\0\0\0c\0", 8}, "ab"}, {OCI_UTF16, {"\0\1a\0", 4}, "\xC4\x80""a"},
        {OCI_UTF16, {"\0\0a\0", 4}, ""}, {OCI_UTF16, {"a\0b\0", 4}, "ab"}};
    for (const auto& c : cases) {
        Environment* const environment = Environment::Open(c.mode, Environment::SetsOf(c.mode), {}, 0);
        EXPECT_EQ(TextIn(*environment, c.text.data(), c.text.size()).View(), c.read);
        Destroy(environment);
    }
}

TEST(CharacterSets, NoPairIsTornAndWhatIsMalformedIsReplaced) {
    const std::pair<std::uint16_t, std::string_view> replaced[] = {{31, "a?z"}, {1000, {"a\0\xFD\xFFz\0", 6}}, {2000, {"\0a\xFF\xFD\0z", 6}}};
    for (const auto& [id, expected] : replaced) {
        std::string text;
        EXPECT_FALSE(charset::FromUtf8(*charset::Find(id), "a\xFFz", text)) << id;
        EXPECT_EQ(text, expected) << id;
    }
    const std::size_t whole[] = {0, 0, 2, 2, 2, 2, 6, 6, 8, 8};
    for (const std::uint16_t id : {1000, 2000}) {
        std::string text;
        const CharacterSet& set = *charset::Find(id);
        EXPECT_TRUE(charset::FromUtf8(set, "\xC3\xA4\xF0\x9F\x98\x80z", text));    // of 2, 4 and 2 bytes
        for (std::size_t room = 0; room < std::size(whole); ++room) EXPECT_EQ(charset::Whole(set, text, room), whole[room]) << room;
    }
}

// Nothing is written behind the room, and what is written is whole characters: so many bytes in 0, 1, ... and the zero.
TEST(TextToBuffer, CutsBetweenCharacters) {
    const std::string_view text = "\xC3\xA4\xF0\x9F\x98\x80z";    // 2, 4 and 1 bytes; 1, 2 and 1 units
    const struct { std::uint32_t mode; std::vector<std::size_t> lengths; } cases[] = {
        {OCI_DEFAULT, {0, 0, 2, 2, 2, 2, 6, 7}}, {OCI_UTF16, {0, 0, 2, 2, 2, 2, 6, 6, 8}}};
    for (const auto& [mode, lengths] : cases) {
        Environment* environment = Environment::Open(mode, Environment::SetsOf(mode), {}, 0);
        std::string kept;
        const std::string_view whole = TextOut(*environment, text, kept);
        const std::size_t zero = mode == OCI_UTF16 ? 2 : 1;
        for (std::size_t room = 0; room < lengths.size() + zero; ++room) {
            std::string expected(32, 'x'), buffer = expected;
            if (room >= zero) {
                const std::size_t length = lengths[room - zero];
                expected.replace(0, length, whole.substr(0, length)).replace(length, zero, zero, '\0');
            }
            EXPECT_EQ(TextToBuffer(*environment, text, buffer.data(), room), room == whole.size() + zero) << room;
            EXPECT_EQ(buffer, expected) << room;
        }
        Destroy(environment);
    }
}

}  // namespace
