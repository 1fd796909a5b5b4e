// Values of many megabytes, in a file: put in and taken in pieces, by bind, locator and define. Whatever the way, every
// byte comes back; and no way but those that need it holds the value in memory.
#include <filesystem>
#include <fstream>

#include "support/statement_fixture.h"

namespace {

constexpr std::size_t kPiece = std::size_t{1} << 20;

// A text that goes on and on, with characters of two bytes that pieces of any size tear apart.
class Endless {
public:
    [[nodiscard]] std::string_view At(std::uint64_t offset, std::size_t length) const {
        return std::string_view(text_).substr(offset % kTurn.size(), length);
    }

private:
    static constexpr std::string_view kTurn = "over and over, \xC3\xA4 turn of sixty-one bytes; \xC3\xB6 \xC3\xBC 0123456789 ";
    std::string text_ = [] {
        std::string text;
        while (text.size() < kPiece + kTurn.size()) text += kTurn;
        return text;
    }();
};

class LongValues : public StatementTest {
protected:
    void SetUp() override {
        char name[] = "/tmp/kelp-long-XXXXXX";
        folder_ = mkdtemp(name);
        database_ = folder_ + "/long.db";
        StatementTest::SetUp();
        lob = NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB);
    }
    void TearDown() override {
        StatementTest::TearDown();
        std::filesystem::remove_all(folder_);
    }

    // Gives the place of the piece that is wanted.
    void Set(const void* buffer, ub4& length, ub1 given) {
        dvoid* handle = nullptr;
        ub4 kind = 0, iteration = 0, index = 0;
        ub1 direction = 0, piece = 0;
        EXPECT_EQ(Answer(OCIStmtGetPieceInfo(stmt, err, &handle, &kind, &direction, &iteration, &index, &piece)), 0);
        EXPECT_EQ(Answer(OCIStmtSetPieceInfo(handle, kind, err, buffer, &length, given, nullptr, nullptr)), 0);
    }
    // Executes what waits for the pieces of a value, and gives them. Answers what the execute does in the end.
    sword GivePieces(std::uint64_t length) {
        sword rc = ExecuteCode();
        for (std::uint64_t done = 0; rc == OCI_NEED_DATA && done < length;) {
            auto part = static_cast<ub4>(std::min<std::uint64_t>(length - done, kPiece));
            const bool last = done + part == length;
            const ub1 piece = done == 0 ? OCI_FIRST_PIECE : last ? OCI_LAST_PIECE : OCI_NEXT_PIECE;
            const std::string_view data = endless_.At(done, part);
            Set(data.data(), part, piece);
            rc = ExecuteCode();
            done += part;
        }
        return rc;
    }
    // The piece that is wanted, of at most `length` bytes; what the fetch that takes it answers.
    sword TakePiece(std::string& buffer, ub4& length) {
        Set(buffer.data(), length, OCI_NEXT_PIECE);
        return FetchCode();
    }
    void BindInPieces(OCIBind** bind, const char* sql, ub2 type) {
        const Area in_pieces{nullptr, 0x7FFFFFFF, type, nullptr, nullptr, nullptr, OCI_DATA_AT_EXEC};
        MUST(Prepare(sql), BindName(bind, ":v", in_pieces));
    }
    // Fetches one value in pieces; the length of it, or where it is another than was put in.
    std::uint64_t TakePieces(std::string_view sql, ub2 type) {
        EXPECT_EQ(Query(sql, {InPieces(type)}, 0), 0) << sql;
        sword rc = FetchCode();
        std::string buffer(kPiece - 1, '\0');
        std::uint64_t done = 0;
        while (rc == OCI_NEED_DATA) {
            auto length = static_cast<ub4>(buffer.size());
            rc = TakePiece(buffer, length);
            if (std::string_view(buffer).substr(0, length) != endless_.At(done, length)) return done;
            done += length;
        }
        EXPECT_EQ(rc, OCI_SUCCESS) << Answer(rc);
        return done;
    }
    // The same through a locator, which tells no bytes of characters beforehand, from an offset.
    std::uint64_t ReadLob(std::uint64_t from = 0) {
        std::string buffer(kPiece, '\0');
        std::uint64_t done = from;
        for (sword rc = OCI_NEED_DATA; rc == OCI_NEED_DATA;) {
            oraub8 bytes = 0;
            rc = OCILobRead2(svc, err, lob, &bytes, nullptr, from + 1, buffer.data(), buffer.size(),
                             done == from ? OCI_FIRST_PIECE : OCI_NEXT_PIECE, nullptr, nullptr, 0, 0);
            EXPECT_GE(rc, 0) << Answer(rc);
            if (rc < 0 || std::string_view(buffer).substr(0, bytes) != endless_.At(done, bytes)) return done;
            done += bytes;
        }
        return done;
    }
    static Area Locator(OCILobLocator*& place, ub2 type) { return {&place, -1, type}; }

    Endless endless_;
    OCILobLocator* lob = nullptr;
    std::string folder_;
};

// Tables in which a value may be filled in when its row stands, and tables in which something looks at it before.
TEST_F(LongValues, ComeBackWholeFromEachKindOfTable) {
    constexpr std::uint64_t kLength = 10 * kPiece + 12345;    // more than is held in memory
    enum class On { both, embedded, server };
    const struct { const char *columns, *more; ub2 type, locator; On on = On::both; } cases[] = {
        {"k number, c clob", "", SQLT_CHR, SQLT_CLOB},
        {"k number, c blob", "", SQLT_LBI, SQLT_BLOB},
        {"k number, c clob, l number", "", SQLT_STR, SQLT_CLOB},
        {"k number, c long", "", SQLT_LNG, SQLT_CLOB},
        {"k number, c long raw", "", SQLT_BIN, SQLT_BLOB},
        {"k number, c clob check (c like 'over%')", "", SQLT_CHR, SQLT_CLOB},
        {"k number, c blob, n number generated always as (length(c))", "", SQLT_BIN, SQLT_BLOB, On::embedded},
        {"k number, c clob", "create index first_of on t(substr(c, 1, 4))", SQLT_CHR, SQLT_CLOB},
        {"k number, c clob", "create index all_of on t(c)", SQLT_CHR, SQLT_CLOB, On::embedded},
        {"k number, c clob", "create index some_of on t(k) where c like 'over%'", SQLT_CHR, SQLT_CLOB},
        {"k number primary key, c clob", "create trigger looks after insert on t begin update t set k = k + length(new.c) where k = new.k; end",
         SQLT_CHR, SQLT_CLOB, On::embedded},
        {"k number, c lo", "", SQLT_LBI, SQLT_BLOB, On::server}};
    if (OnServer()) MustRun("create domain lo as oid");
    MustRun("create table short(c clob)", "insert into short values('a few bytes')", "commit");
    EXPECT_EQ(One("select c from short"), "a few bytes");
    for (const auto& c : cases) {
        if (c.on == (OnServer() ? On::embedded : On::server)) continue;    // what the other one writes otherwise, or does not take
        SCOPED_TRACE(std::string(c.columns) + c.more);
        MustRun(std::string("create table t(") + c.columns + ")");
        if (*c.more) MustRun(c.more);
        OCIBind* bind = nullptr;
        BindInPieces(&bind, "insert into t(k, c) values(1, :v)", c.type);
        EXPECT_EQ(GivePieces(kLength), OCI_SUCCESS) << Answer(OCI_ERROR);
        EXPECT_EQ(One("select count(*) from t"), "1");
        MustRun("commit");
        for (const char* rows : {"select c from t", "select c from t, (select 1 as one from dual) o"})
            EXPECT_EQ(TakePieces(rows, c.type), kLength);
        // From its locator into another row, which shows in the same table's other rows and nowhere else.
        ASSERT_EQ(Query("select c from t", {Locator(lob, c.locator)}), 0);
        MUST(Ready("insert into t(k, c) values(2, :v)", {Locator(lob, c.locator)}), Execute());
        MUST(Ready("update t set c = :v, k = k + 10 where k > 1", {Locator(lob, c.locator)}), Execute());
        EXPECT_EQ(TakePieces("select c from t where k > 1 order by k desc", c.type), kLength);
        MustRun("rollback");
        EXPECT_EQ(One("select count(*) from t"), "1");
        EXPECT_EQ(ReadLob(), kLength);
        MustRun("drop table t");
    }
}

// Text of a terminated type ends at its zero, in whatever piece; a character may be torn between two, not at the end.
TEST_F(LongValues, OfTextsThatEndAndAreConverted) {
    const std::string text(8'500'000, 'x'), units = [&] { std::string s; for (char c : text) (s += c) += '\0'; return s; }();
    const auto bytes = [](const char* from, std::size_t size) { return std::string(from, size); };
    const struct { ub2 type, set; std::string first, second, third; sb4 answer; ub4 length; const char* last; } cases[] = {
        {SQLT_STR, 0, text, bytes("y\0z", 3), "more", 0, 8500001, "y"}, {SQLT_CHR, 0, text, "y", "z", 0, 8500002, "z"},
        {SQLT_CHR, 1000, units, bytes("y\0\x3D", 3), bytes("\xD8\0\xDE", 3) + units.substr(0, 4'000'000) + bytes("\x3D\xD8\0\xDE", 4),
         0, 10500003, "\xF0\x9F\x98\x80"},
        {SQLT_CHR, 1000, units, bytes("y\0\x3D", 3), bytes("\xD8", 1), 24365, 0, ""},
        {SQLT_STR, 1000, units + bytes("a\0b", 3), bytes("\0\0\0c\0", 5), bytes("d\0", 2), 0, 8500002, "b"},
        {SQLT_STR, 1000, bytes("a\0b", 3), bytes("\0\0\0c\0", 5), bytes("d\0", 2), 0, 2, "b"}};
    MustRun("create table t(c clob)");
    for (const auto& c : cases) {
        OCIBind* bind = nullptr;
        BindInPieces(&bind, "insert into t values(:v)", c.type);
        ub2 set = c.set;
        ASSERT_TRUE(set == 0 || OCIAttrSet(bind, OCI_HTYPE_BIND, &set, 0, OCI_ATTR_CHARSET_ID, err) == OCI_SUCCESS);
        sword rc = ExecuteCode();
        for (const std::string* piece : {&c.first, &c.second, &c.third}) {
            ASSERT_EQ(rc, OCI_NEED_DATA);
            ub4 length = Size(*piece);
            const ub1 place = piece == &c.first ? OCI_FIRST_PIECE : piece == &c.second ? OCI_NEXT_PIECE : OCI_LAST_PIECE;
            Set(piece->data(), length, place);
            rc = ExecuteCode();
        }
        EXPECT_EQ(Answer(rc), c.answer);
        if (c.answer != 0) continue;
        char last[5] = "";
        ub4 length = 0, amount = 1;
        ASSERT_EQ(Query("select c from t", {Locator(lob, SQLT_CLOB)}) + Answer(OCILobGetLength(svc, err, lob, &length)), 0);
        EXPECT_EQ(Answer(OCILobRead(svc, err, lob, &amount, length, last, 4, nullptr, nullptr, 0, 0)), 0);
        EXPECT_EQ(length, c.length);
        EXPECT_STREQ(last, c.last);
        MustRun("delete from t");
    }
}

// A value that changes while its pieces are taken is not made up of old and new ones.
TEST_F(LongValues, DoNotChangeBetweenPieces) {
    MustRun("create table t(k number, c blob)", "insert into t values(1, zeroblob(20000000))", "insert into t values(2, null)");
    OCIStmt* const query = stmt;
    OCIStmt* const change = New<OCIStmt>(OCI_HTYPE_STMT);
    std::string buffer(kPiece, '\0');
    const auto take = [&] {
        auto length = static_cast<ub4>(buffer.size());
        return TakePiece(buffer, length);
    };
    ASSERT_EQ(Query("select c from t where k = 1 for update", {InPieces(SQLT_LBI)}, 0), 0);
    ASSERT_EQ(FetchCode(), OCI_NEED_DATA);
    EXPECT_EQ(take(), OCI_NEED_DATA);
    const auto runs = [&](const char* sql) {
        stmt = change;
        EXPECT_EQ(Run(sql), 0) << sql;
        stmt = query;
    };
    runs("update t set c = x'00' where k = 2");
    EXPECT_EQ(take(), OCI_NEED_DATA);
    runs("update t set c = zeroblob(10000000) where k = 1");
    EXPECT_EQ(Answer(take()), 22924);
    EXPECT_EQ(FetchCode(), OCI_NO_DATA);
}

// Megabytes of freed memory that the address sanitizer keeps.
#if defined(__SANITIZE_ADDRESS__)
constexpr std::uint64_t kQuarantine = 512;
#elif defined(__has_feature)
constexpr std::uint64_t kQuarantine = __has_feature(address_sanitizer) ? 512 : 0;
#else
constexpr std::uint64_t kQuarantine = 0;
#endif

// The resident memory of the process: now, or the most since Forget.
struct Memory {
    static void Forget() { std::ofstream("/proc/self/clear_refs") << "5"; }
    static std::uint64_t Of(std::string_view name) {
        std::ifstream status("/proc/self/status");
        std::string line;
        while (std::getline(status, line))
            if (line.starts_with(name)) return std::stoull(line.substr(name.size() + 1)) << 10;
        ADD_FAILURE() << "no " << name;
        return 0;
    }
};

// Resident memory, above what the process had: the engine's page cache is in it.
TEST_F(LongValues, NeedLittleMemory) {
    constexpr std::uint64_t kLength = 200 * kPiece;
    constexpr std::uint64_t kLongest = 953 * kPiece;    // the engine's limit for a row is 1000 million bytes
    constexpr std::uint64_t kMost = std::uint64_t{64 + kQuarantine} << 20;
    MustRun("create table t(k blob, c blob)");
    Memory::Forget();
    const std::uint64_t before = Memory::Of("VmRSS");
    const auto grown = [&] { return Memory::Of("VmHWM") - before; };

    OCIBind *bind = nullptr, *none = nullptr;
    sb2 null = -1;
    BindInPieces(&bind, "insert into t values(:k, :v)", SQLT_LBI);
    MUST(BindName(&none, ":k", Area{nullptr, 0, SQLT_LBI, &null}));
    EXPECT_EQ(GivePieces(kLength), OCI_SUCCESS);
    EXPECT_LT(grown(), kMost) << "a bind in pieces";
    EXPECT_EQ(TakePieces("select c from t", SQLT_LBI), kLength);
    EXPECT_LT(grown(), kMost) << "a define in pieces";

    ASSERT_EQ(Query("select c from t for update", {Locator(lob, SQLT_BLOB)}), 0);
    for (std::uint64_t done = 0; done < kLongest; done += kPiece) {
        oraub8 bytes = 0;
        const ub1 piece = done == 0 ? OCI_FIRST_PIECE : done + kPiece < kLongest ? OCI_NEXT_PIECE : OCI_LAST_PIECE;
        const sword rc = OCILobWrite2(svc, err, lob, &bytes, nullptr, 1, const_cast<char*>(endless_.At(done, kPiece).data()),
                                      kPiece, piece, nullptr, nullptr, 0, 0);
        ASSERT_EQ(rc, piece == OCI_LAST_PIECE ? OCI_SUCCESS : OCI_NEED_DATA) << Answer(rc);
    }
    EXPECT_EQ(ReadLob(kLongest - 2 * kPiece + 8), kLongest) << "from the middle of what waits in a file";
    ASSERT_EQ(Query("select c from t for update", {Locator(lob, SQLT_BLOB)}), 0);    // what was written is stored now
    EXPECT_EQ(ReadLob(), kLongest);
    EXPECT_LT(grown(), kMost) << "writes and reads in pieces";
    MustRun("rollback");
}

}  // namespace
