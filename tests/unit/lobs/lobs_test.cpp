// Large objects as an application uses them: locators of columns and temporary ones, characters, pieces, what is refused.
#include <algorithm>
#include <thread>

#include "support/statement_fixture.h"

namespace {

constexpr ub4 kPast = 0xFFFFFFFF;    // an offset or amount of 4 GB

class Lobs : public StatementTest {
protected:
    explicit Lobs(ub4 mode = OCI_DEFAULT) : StatementTest(mode) {}
    void SetUp() override {
        StatementTest::SetUp();
        MustRun("create table l(k integer, c clob, b blob)", "insert into l values(1, 'h\xC3\xA4llo world', x'010203')",
                "commit");
        lob = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
        other = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    }
    static Area Locator(OCILobLocator*& place, ub2 type = SQLT_CLOB) { return {&place, -1, type}; }
    // The locator of the one row's column; for update, it may be written.
    void Fetch(OCILobLocator*& place, const char* sql = "select c from l for update", ub2 type = SQLT_CLOB) {
        ASSERT_EQ(Query(sql, {Locator(place, type)}), 0) << sql;
    }
    void Temporary(OCILobLocator* place, ub1 type = OCI_TEMP_CLOB) {
        ASSERT_EQ(Answer(OCILobCreateTemporary(svc, err, place, 0, 0, type, TRUE, OCI_DURATION_SESSION)), 0);
    }
    sb4 Write(OCILobLocator* to, ub4 offset, std::string_view data, ub1 piece = OCI_ONE_PIECE, ub4* amount = nullptr) {
        ub4 own = 0;
        return Code(OCILobWrite(svc, err, to, amount ? amount : &own, offset, const_cast<char*>(data.data()), Size(data),
                                piece, nullptr, nullptr, 0, 0));
    }
    // Data, with the amount before it; or the number of the error, or a code without one.
    std::string Read(OCILobLocator* from, ub4 amount = 1000, ub4 offset = 1, ub4 room = 1000, ub2 set = 0) {
        std::string data(room, '#');
        const sb4 code = Code(OCILobRead(svc, err, from, &amount, offset, data.data(), room, nullptr, nullptr, set, 0));
        const std::string shown = std::to_string(amount) + ":" + data.substr(0, data.find('#'));
        return code == 0 ? shown : code == OCI_NEED_DATA ? "more " + shown : "!" + std::to_string(code);
    }
    sb4 Code(sword code) { return code == OCI_ERROR ? Answer(code) : code; }
    ub4 LengthOf(OCILobLocator* of) {
        ub4 length = 4711;
        EXPECT_EQ(Answer(OCILobGetLength(svc, err, of, &length)), 0);
        return length;
    }

    OCILobLocator* lob = nullptr;
    OCILobLocator* other = nullptr;
};

sb4 Takes(dvoid* context, const dvoid* data, ub4 length, ub1 piece) {
    auto& taken = *static_cast<std::string*>(context);
    taken += std::to_string(piece) + std::string(static_cast<const char*>(data), length);
    return taken.find('!') == std::string::npos ? OCI_CONTINUE : OCI_ERROR;
}
sb4 Gives(dvoid* context, dvoid* room, ub4* length, ub1* piece) {
    auto& pieces = *static_cast<std::vector<std::string>*>(context);
    if (pieces.empty()) return OCI_ERROR;
    *length = static_cast<ub4>(pieces.front().copy(static_cast<char*>(room), *length));
    pieces.erase(pieces.begin());
    *piece = pieces.empty() ? OCI_LAST_PIECE : OCI_NEXT_PIECE;
    return OCI_CONTINUE;
}

// The second piece is given elsewhere.
sb4 GivesElsewhere(dvoid* context, dvoid* room, oraub8* length, ub1* piece, dvoid** changed, oraub8* changed_length) {
    auto& elsewhere = *static_cast<std::string*>(context);
    const bool second = room == elsewhere.data();
    *piece = second ? OCI_LAST_PIECE : OCI_NEXT_PIECE;
    *changed = elsewhere.data();
    *changed_length = elsewhere.size();
    *length = std::string_view(second ? "abc\xC3\xA4" : "xy").copy(static_cast<char*>(room), *length);
    return OCI_CONTINUE;
}

TEST_F(Lobs, PiecesGoThroughCallbacks) {
    Temporary(lob);
    std::vector<std::string> pieces{"abc", "", "de\xC3", "\xA4"};
    char room[8];
    ub4 amount = 0;
    EXPECT_EQ(Answer(OCILobWrite(svc, err, lob, &amount, 1, room, 8, OCI_FIRST_PIECE, &pieces, Gives, 0, 0)), 0);
    EXPECT_EQ(amount, 6u);
    std::string taken;
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &(amount = 2), 1, nullptr, 0, &taken, Takes, 0, 0)), 0);
    EXPECT_EQ(taken, "3ab") << "in room of the library's own";
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &(amount = 7), 1, room, 4, &(taken = "!"), Takes, 0, 0)), 24802);
    EXPECT_EQ(amount, 7u) << "a failure tells of none";
    EXPECT_EQ(Answer(OCILobWrite(svc, err, lob, &amount, 1, room, 8, OCI_FIRST_PIECE, &pieces, Gives, 0, 0)), 24802);
    const struct { ub4 length; ub1 piece; sb4 answer; } odd[] = {
        {9, OCI_LAST_PIECE, 24801}, {1, OCI_LAST_PIECE + 1, 24801}, {1, OCI_ONE_PIECE, 0}};
    for (const auto& c : odd) {
        const auto gives = [](dvoid* context, dvoid*, ub4* length, ub1* piece) -> sb4 {
            const auto& told = *static_cast<decltype(&c)>(context);
            *length = told.length, *piece = told.piece;
            return OCI_CONTINUE;
        };
        EXPECT_EQ(Answer(OCILobWrite(svc, err, lob, &(amount = 0), 1, room, 8, OCI_FIRST_PIECE,
                                     const_cast<void*>(static_cast<const void*>(&c)), gives, 0, 0)), c.answer);
    }
    std::string elsewhere(8, '#');
    oraub8 bytes = 0, characters = 0;
    Temporary(other);
    EXPECT_EQ(Write(other, 1, "\xC3\xA4"), 0);
    EXPECT_EQ(Answer(OCILobWriteAppend2(svc, err, other, &bytes, &characters, room, 2, OCI_FIRST_PIECE, &elsewhere,
                                        GivesElsewhere, 0, 0)), 0);
    EXPECT_EQ(bytes * 10 + characters, 76u);
    EXPECT_EQ(Read(other), "7:\xC3\xA4xyabc\xC3\xA4");
    EXPECT_EQ(Answer(OCILobWriteAppend(svc, err, other, &(amount = 1), &(room[0] = 'z'), 1, OCI_ONE_PIECE, nullptr, nullptr, 0, 0)), 0);
    const auto moves = [](dvoid* context, const dvoid* data, oraub8 length, ub1, dvoid** changed, oraub8* room_there) -> sb4 {
        static_cast<std::string*>(context)->append(static_cast<const char*>(data), length) += '|';
        static char wider[5];
        if (length < sizeof wider) *changed = wider, *room_there = sizeof wider;    // else it stays
        return OCI_CONTINUE;
    };
    EXPECT_EQ(Answer(OCILobRead2(svc, err, other, &(bytes = 0), nullptr, 1, room, 2, OCI_FIRST_PIECE, &(taken = ""), moves, 0, 0)), 0);
    EXPECT_EQ(taken, "\xC3\xA4|xyabc|\xC3\xA4z|");
    for (const ub4 length : {4u, 0u}) {    // room of the library's own
        Temporary(other);
        EXPECT_EQ(Answer(OCILobWrite(svc, err, other, &(amount = 0), 1, nullptr, length, OCI_FIRST_PIECE, &(pieces = {"abcdef"}), Gives, 0, 0)), 0);
        EXPECT_EQ(Read(other), length == 4 ? "4:abcd" : "6:abcdef");
    }
    const auto asks = [](dvoid* context, const dvoid*, ub4, ub1) -> sb4 {
        auto& self = *static_cast<decltype(this)>(context);
        ub4 length = 0;
        EXPECT_EQ(self.Answer(OCILobGetLength(self.svc, self.err, self.lob, &length)), 24820);
        EXPECT_EQ(self.Read(self.lob), "!24804");
        OCIStmt* made = nullptr;
        std::thread([&] {
            EXPECT_EQ(OCIHandleFree(self.New<OCIStmt>(OCI_HTYPE_STMT), OCI_HTYPE_STMT), OCI_SUCCESS);
            made = self.New<OCIStmt>(OCI_HTYPE_STMT);
        }).join();
        const sb4 before = OCI_memGetMemCount();
        EXPECT_EQ(OCIHandleFree(made, OCI_HTYPE_STMT), OCI_SUCCESS);
        EXPECT_LT(OCI_memGetMemCount(), before) << "what others made meanwhile waits for nothing";
        return OCI_CONTINUE;
    };
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &(amount = 0), 1, room, 4, this, asks, 0, 0)), 0);
    const auto breaks = [](dvoid* context, auto...) -> sb4 {
        auto& self = *static_cast<decltype(this)>(context);
        EXPECT_EQ(OCIBreak(self.svc, self.err), OCI_SUCCESS);
        return OCI_CONTINUE;
    };
    Temporary(other);
    EXPECT_EQ(Write(other, 1, "12345"), 0);
    EXPECT_EQ(Answer(OCILobRead(svc, err, other, &(amount = 0), 1, room, 4, this, breaks, 0, 0)), 1013);
    MUST(Answer(OCIReset(svc, err)));
    EXPECT_EQ(Answer(OCILobWrite(svc, err, other, &(amount = 0), 1, room, 4, OCI_FIRST_PIECE, this, breaks, 0, 0)), 1013);
    MUST(Answer(OCIReset(svc, err)));
    const auto leaves = [](dvoid* context, auto, auto length, auto piece) -> sb4 {
        auto& self = *static_cast<decltype(this)>(context);
        EXPECT_EQ(OCILogoff(self.svc, self.err), OCI_SUCCESS);
        if constexpr (std::is_pointer_v<decltype(piece)>) *length = 1, *piece = OCI_LAST_PIECE;
        return OCI_CONTINUE;
    };
    EXPECT_EQ(Answer(OCILobWrite(svc, err, lob, &(amount = 0), 1, room, 4, OCI_FIRST_PIECE, this, leaves, 0, 0)), 3114);
    ASSERT_EQ(Logon(&svc), OCI_SUCCESS);
    Temporary(lob), Write(lob, 1, "ab");
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &(amount = 0), 1, room, 4, this, leaves, 0, 0)), 3114);
    ASSERT_EQ(Logon(&svc), OCI_SUCCESS);
}

// Places that the calls want and scripts always give; amounts of the wider calls, in bytes and characters.
TEST_F(Lobs, NullPlacesAndWideAmounts) {
    ub4 length = 1;
    boolean flag = TRUE;
    char room[] = "\xC3\xB6xyz";
    EXPECT_EQ(Answer(OCILobLocatorIsInit(env, err, lob, nullptr)), 21560);
    EXPECT_EQ(Answer(OCILobLocatorIsInit(env, err, lob, &flag)), 0);
    EXPECT_EQ(flag, FALSE);
    EXPECT_EQ(OCILobGetLength(svc, err, nullptr, &length), OCI_ERROR);
    EXPECT_EQ(OCILobGetLength(svc, err, reinterpret_cast<OCILobLocator*>(room), &length), OCI_INVALID_HANDLE);
    Fetch(lob);
    Fetch(other, "select b from l for update", SQLT_BLOB);
    EXPECT_EQ(Answer(OCILobGetLength(svc, err, lob, nullptr)), 21560);
    EXPECT_EQ(Answer(OCILobGetChunkSize(svc, err, lob, nullptr)) + Answer(OCILobIsOpen(svc, err, lob, nullptr)), 2 * 21560);
    EXPECT_EQ(Answer(OCILobGetChunkSize(svc, err, lob, &length)) + length, 65536u);
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, nullptr, 1, room, 5, nullptr, nullptr, 0, 0)), 21560);
    EXPECT_EQ(Answer(OCILobErase(svc, err, lob, nullptr, 1)), 21560);
    EXPECT_EQ(Answer(OCILobRead2(svc, err, lob, nullptr, nullptr, 1, room, 5, 0, nullptr, nullptr, 0, 0)), 21560);
    EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &length, 1, nullptr, 4, nullptr, nullptr, 0, 0)), 24803);
    EXPECT_EQ(Write(lob, kPast, "x"), 22925);
    EXPECT_EQ(Read(lob, kPast), "11:h\xC3\xA4llo world");
    oraub8 bytes = 1;
    for (const auto& [offset, answer] : {std::pair{~oraub8{0}, 24281}, {(oraub8{1} << 36) + 1, 24281}, {oraub8{1} << 36, 22925}})
        EXPECT_EQ(Answer(OCILobWrite2(svc, err, lob, nullptr, &bytes, offset, room, 1, 0, nullptr, nullptr, 0, 0)), answer);
    const struct { bool of_bytes; oraub8 bytes, characters, told_bytes, told_characters; } reads[] = {
        {false, 3, 0, 3, 2}, {false, 0, 9, 6, 5}, {true, 9, 1, 3, 3}};
    for (const auto& c : reads) {
        char area[6];
        bytes = c.bytes;
        oraub8 characters = c.characters;
        EXPECT_EQ(Answer(OCILobRead2(svc, err, c.of_bytes ? other : lob, &bytes, &characters, 1, area, 6, OCI_ONE_PIECE,
                                     nullptr, nullptr, 0, 0)), 0);
        EXPECT_EQ(bytes, c.told_bytes) << c.bytes;
        EXPECT_EQ(characters, c.told_characters) << c.bytes;
        characters = 0;
        EXPECT_EQ(Answer(OCILobRead2(svc, err, other, nullptr, &characters, 1, area, 6, OCI_ONE_PIECE, nullptr, nullptr, 0, 0)), 0);
        EXPECT_EQ(characters, 3u);
    }
    SHOULD(Answer(OCILobWrite2(svc, err, lob, &(bytes = 3), nullptr, 1, room, 5, 0, nullptr, nullptr, 0, 0)));
    EXPECT_EQ(Read(lob, 4), "4:\xC3\xB6xll") << "the amount in bytes";
    oraub8 two = 2;
    SHOULD(Answer(OCILobWrite2(svc, err, lob, nullptr, &two, 1, room, 5, 0, nullptr, nullptr, 0, 0)));
    EXPECT_EQ(two, 2u) << "in characters";
    EXPECT_EQ(OCILobWrite2(svc, err, lob, &(bytes = 2), nullptr, 1, room, 2, OCI_FIRST_PIECE, nullptr, nullptr, 0, 0), OCI_NEED_DATA);
    EXPECT_EQ(Answer(OCILobWrite2(svc, err, lob, &bytes, nullptr, 1, room + 2, 1, OCI_LAST_PIECE, nullptr, nullptr, 0, 0)), 24810);
    Temporary(other);
    MUST(Answer(OCILobEnableBuffering(svc, err, other)));
    EXPECT_EQ(Write(other, 1, "\xC3\xB6" + std::string((512 << 10) - 2, 'x')), 0);
    EXPECT_EQ(Write(other, 512 << 10, "x"), 22280) << "no more than those bytes wait";
    MUST(Answer(OCILobDisableBuffering(svc, err, other)));
    EXPECT_EQ(LengthOf(other), (512u << 10) - 1);
}

// What goes in pieces holds the session's other calls up, until it is finished or its locator is gone.
TEST_F(Lobs, PiecesThatAreNotFinished) {
    ub4 length = 0, amount = 3;
    Fetch(lob);
    Temporary(other);
    EXPECT_EQ(Write(other, 1, "ab\xC3", OCI_FIRST_PIECE, &amount), OCI_NEED_DATA);
    EXPECT_EQ(Answer(OCI_ERROR), 3129);
    EXPECT_EQ(Read(other), "!24804");
    EXPECT_EQ(Write(lob, 1, "x"), 24804);
    EXPECT_EQ(Write(other, 99, "\xA4", OCI_LAST_PIECE, &amount), 0) << "the offset is not looked at";
    EXPECT_EQ(Read(lob, 11, 1, 4), "more 4:h\xC3\xA4l");
    EXPECT_EQ(Answer(OCI_ERROR), 3130);
    MUST(Answer(OCIBreak(svc, err)));
    EXPECT_EQ(Read(lob), "!1013");
    MUST(Answer(OCIReset(svc, err)));
    EXPECT_EQ(Read(lob, 11, 1, 4), "more 4:h\xC3\xA4l") << "from the beginning";
    EXPECT_EQ(Read(other), "!24804");
    EXPECT_EQ(Write(lob, 1, "x"), 24804);
    EXPECT_EQ(Answer(OCILobGetLength(svc, err, lob, &length)), 24820);
    EXPECT_EQ(OCIDescriptorFree(lob, OCI_DTYPE_LOB), OCI_SUCCESS);
    EXPECT_EQ(Read(other), "3:ab\xC3\xA4");
}

TEST_F(Lobs, FormsOfEachKind) {
    const struct { ub1 type, given, form; ub2 set; } cases[] = {
        {OCI_TEMP_NCLOB, SQLCS_IMPLICIT, SQLCS_NCHAR, 2000}, {OCI_TEMP_NCLOB, SQLCS_NCHAR, SQLCS_NCHAR, 2000},
        {OCI_TEMP_CLOB, SQLCS_NCHAR, SQLCS_NCHAR, 2000}, {OCI_TEMP_CLOB, 0, SQLCS_IMPLICIT, 873},
        {OCI_TEMP_BLOB, SQLCS_NCHAR, 0, 0}};
    const auto expect = [&](ub1 wanted_form, ub2 wanted_set) {
        ub1 form = 9;
        ub2 set = 9;
        SHOULD(Answer(OCILobCharSetForm(env, err, lob, &form)), Answer(OCILobCharSetId(env, err, lob, &set)));
        EXPECT_EQ(form, wanted_form);
        EXPECT_EQ(set, wanted_set);
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Answer(OCILobCreateTemporary(svc, err, lob, 0, c.given, c.type, FALSE, OCI_DURATION_SESSION)), 0);
        expect(c.form, c.set);
    }
    MustRun("create table n(n nclob)", "insert into n values('x')");
    Fetch(lob, "select n from n", SQLT_DBCLOB);
    expect(SQLCS_NCHAR, 2000);
    EXPECT_EQ(Ready("update n set n = lower(:v)", {Locator(lob, SQLT_DBCLOB)}) + Execute(), 0) << "a text";
    Fetch(lob);
    expect(SQLCS_IMPLICIT, 873);
}

}  // namespace
