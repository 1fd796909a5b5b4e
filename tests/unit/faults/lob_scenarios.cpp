// Large objects: temporary ones, those of columns, pieces, copies, buffering.
#include "faults/world.h"

namespace faults {
namespace {

// Longer than what a draft or a temporary object holds in memory at once.
constexpr ub4 kLong = 70000;

void TableOfLobs(World& w) {
    w.Sql("create table l(k integer, c clob, b blob)");
    w.Sql("insert into l values(1, 'a value of some length that is h\xC3\xA4lf as long', x'0102030405')");
    w.Sql("commit");
}

// Locators are filled by the calls, not by their making.
OCILobLocator* NewLocator(World& w) { return w.NewDescriptor<OCILobLocator>(OCI_DTYPE_LOB); }

OCILobLocator* Temporary(World& w, ub1 type = OCI_TEMP_CLOB) {
    OCILobLocator* lob = NewLocator(w);
    w.STEP(OCILobCreateTemporary, w.svc, w.err, lob, 0, 0, type, TRUE, OCI_DURATION_SESSION);
    return lob;
}

OCILobLocator* Select(World& w, const char* sql, ub2 type = SQLT_CLOB) {
    static OCILobLocator* lob;
    lob = NewLocator(w);
    w.Prepare(sql);
    w.Define(1, {&lob, -1, type});
    w.Execute(1);
    return lob;
}

sword Write(World& w, OCILobLocator* lob, ub4 offset, std::string_view data, ub1 piece = OCI_ONE_PIECE) {
    ub4 amount = 0;
    return w.STEP(OCILobWrite, w.svc, w.err, lob, &amount, offset, World::Text(data), World::Size(data), piece, nullptr,
                  nullptr, 0, 0);
}

// Sees how much there is of what, or all of it when it is short.
void SeeLob(World& w, OCILobLocator* lob) {
    ub4 length = 0, amount = 0;
    w.STEP(OCILobGetLength, w.svc, w.err, lob, &length);
    std::string data(4 * kLong, '#');
    w.STEP(OCILobRead, w.svc, w.err, lob, &amount, 1, data.data(), World::Size(data), nullptr, nullptr, 0, 0);
    const std::size_t end = data.find('#');
    w.See(amount == length ? static_cast<long>(end) : -1);
    if (end < 100) w.See(std::string_view(data).substr(0, end));
}

// Grows in memory, then in a file, with a gap.
SCENARIO(LobTemporaryGrows, session, nullptr, "5;h\xC3\xA4lf;141000;4;h  x;") {
    const std::string much(kLong, 'x');
    OCILobLocator* const lob = Temporary(w);
    Write(w, lob, 1, "h\xC3\xA4lf");
    SeeLob(w, lob);
    Write(w, lob, 3, much);
    Write(w, lob, kLong + 1000, much);
    SeeLob(w, lob);
    w.STEP(OCILobTrim, w.svc, w.err, lob, 4);
    ub4 amount = 2;
    w.STEP(OCILobErase, w.svc, w.err, lob, &amount, 2);
    SeeLob(w, lob);
    w.STEP(OCILobFreeTemporary, w.svc, w.err, lob);
}

constexpr const char* kBytes = "select hex(b) from l";
constexpr const char* kWidth = "select length(c) from l";

// A commit that fails loses all, and says so, or nothing.
void WriteColumn(World& w, const char* query, ub2 type, ub4 offset, std::string_view data, const char* kept,
                 std::string_view value, std::string_view before) {
    w.AtEnd([&w] {
        w.Sql("update l set c = 'a value of some length that is h\xC3\xA4lf as long', b = x'0102030405'");
        w.Sql("commit");
        return OCI_SUCCESS;
    });
    OCILobLocator* const lob = Select(w, query, type);
    Write(w, lob, offset, data);
    SeeLob(w, lob);
    w.Keeps(kept, value, before);
    w.STEP(OCITransCommit, w.svc, w.err, OCI_DEFAULT);
}

SCENARIO(LobColumnInPlace, session, TableOfLobs, "5;\x01" "ab\x04\x05;") {
    WriteColumn(w, "select b from l for update", SQLT_BLOB, 2, "ab", kBytes, "0161620405", "0102030405");
}
SCENARIO(LobColumnGrows, session, TableOfLobs, "70040;") {
    WriteColumn(w, "select c from l for update", SQLT_CLOB, 40, std::string(kLong, 'y'), kWidth, "70039", "43");
}

// Objects that the server keeps for itself, and what is bound becomes one.
void TableOfObjects(World& w) {
    if (w.OnServer()) w.Sql("create domain lo as oid");
    w.Sql(w.OnServer() ? "create table o(b lo, c blob)" : "create table o(b blob, c blob)");
}
SCENARIO(LobObjects, session, TableOfObjects, "20;some words and more ;") {
    w.Run("insert into o values(empty_blob(), x'00')");
    char bytes[] = "some bytes";
    w.Prepare("update o set b = :1");
    w.Bind(1, {bytes, 10, SQLT_BIN});
    w.Execute();
    OCILobLocator* const lob = Select(w, "select b from o", SQLT_BLOB);
    Write(w, lob, 6, "words and more of them");
    w.STEP(OCILobTrim, w.svc, w.err, lob, 20);
    SeeLob(w, lob);
}

SCENARIO(LobCopies, session, TableOfLobs, "24;  value of s  value of s;24;zzvalue of s  value of s;") {
    OCILobLocator* const from = Select(w, "select c from l");
    OCILobLocator* const to = Temporary(w);
    OCILobLocator* other = NewLocator(w);
    w.STEP(OCILobCopy, w.svc, w.err, to, from, 10, 3, 3);
    w.STEP(OCILobAppend, w.svc, w.err, to, to);
    w.STEP(OCILobLocatorAssign, w.svc, w.err, to, &other);
    Write(w, other, 1, "zz");
    SeeLob(w, to);
    SeeLob(w, other);
}

SCENARIO(LobBuffered, session, TableOfLobs, "44;One and much more twoh that is h\xC3\xA4lf as long;") {
    OCILobLocator* const lob = Select(w, "select c from l for update");
    w.STEP(OCILobEnableBuffering, w.svc, w.err, lob);
    Write(w, lob, 1, "one and much more ");
    Write(w, lob, 19, "two");
    w.STEP(OCILobFlushBuffer, w.svc, w.err, lob, OCI_LOB_BUFFER_FREE);
    Write(w, lob, 1, "O");
    w.STEP(OCILobDisableBuffering, w.svc, w.err, lob);
    w.STEP(OCILobOpen, w.svc, w.err, lob, OCI_LOB_READWRITE);
    SeeLob(w, lob);
    w.STEP(OCILobClose, w.svc, w.err, lob);
}

// Polled, of UTF-16.
SCENARIO(LobPieces, session, nullptr, "3;") {
    OCILobLocator* const lob = Temporary(w);
    ub4 amount = 0;
    for (const ub1 piece : {OCI_FIRST_PIECE, OCI_NEXT_PIECE, OCI_LAST_PIECE}) {
        w.STEP(OCILobWrite, w.svc, w.err, lob, &amount, 1, const_cast<char16_t*>(u"and twenty letters more"), 46, piece,
               nullptr, nullptr, OCI_UTF16ID, 0);
    }
    char buffer[30];
    long pieces = 0;
    for (sword code = OCI_NEED_DATA; code == OCI_NEED_DATA; ++pieces) {
        amount = 0;
        code = w.STEP(OCILobRead, w.svc, w.err, lob, &amount, 1, buffer, sizeof buffer, nullptr, nullptr, 0, 0);
    }
    w.See(pieces);
}

}  // namespace
}  // namespace faults
