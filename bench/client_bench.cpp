// What a user of the client library would notice, each beside the same work on the engine's own interface in the same
// run: rows inserted by array binds, rows fetched into array defines and in pieces, large objects. Prints the median of the
// paired ratios.
//   client_bench [runs]
#include <sqlite3.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <stdexcept>
#include <string>
#include <vector>

#include "client_work.h"
#include "legacy_work.h"
#include "oci.h"

namespace {

namespace fs = std::filesystem;

void Remove(const std::string& file) {
    for (const char* ending : {"", "-wal", "-shm", "-journal"}) fs::remove(file + ending);
}

struct Bare {
    sqlite3* database = nullptr;
    explicit Bare(const std::string& file) {
        if (sqlite3_open(file.c_str(), &database) != SQLITE_OK) Fail("cannot open " + file);
        Run("pragma journal_mode=wal");
    }
    ~Bare() { sqlite3_close(database); }
    Bare(const Bare&) = delete;
    Bare& operator=(const Bare&) = delete;
    void Run(const char* sql) const {
        if (sqlite3_exec(database, sql, nullptr, nullptr, nullptr) != SQLITE_OK) Fail(sqlite3_errmsg(database));
    }
    sqlite3_stmt* Prepare(const char* sql) const {
        sqlite3_stmt* query = nullptr;
        if (sqlite3_prepare_v2(database, sql, -1, &query, nullptr) != SQLITE_OK) Fail(sqlite3_errmsg(database));
        return query;
    }
};

void InsertBare(const std::string& file) {
    const Bare bare(file);
    bare.Run(kTable);
    sqlite3_stmt* query = bare.Prepare("insert into t values(?1, ?2, ?3, ?4, ?5)");
    std::vector<Buffer> buffers = Buffers();
    bare.Run("begin");
    for (ub4 first = 0; first < kRows; first += kBatch) {
        FillBatch(buffers, first);
        for (ub4 row = 0; row < kBatch; ++row) {
            sb8 id;
            double price;
            char day[20];
            std::memcpy(&id, buffers[0].At(row), sizeof id);
            std::memcpy(&price, buffers[1].At(row), sizeof price);
            const auto* date = reinterpret_cast<const unsigned char*>(buffers[3].At(row));
            const int length = std::snprintf(day, sizeof day, "%02d%02d-%02d-%02d 00:00:00", date[0] - 100,
                                             date[1] - 100, date[2], date[3]);
            sqlite3_bind_int64(query, 1, id);
            sqlite3_bind_double(query, 2, price);
            sqlite3_bind_text(query, 3, buffers[2].At(row), buffers[2].lengths[row], SQLITE_STATIC);
            sqlite3_bind_text(query, 4, day, length, SQLITE_STATIC);
            if (buffers[4].indicators[row] < 0) sqlite3_bind_null(query, 5);
            else sqlite3_bind_text(query, 5, buffers[4].At(row), buffers[4].lengths[row], SQLITE_STATIC);
            if (sqlite3_step(query) != SQLITE_DONE) Fail(sqlite3_errmsg(bare.database));
            sqlite3_reset(query);
        }
    }
    bare.Run("commit");
    sqlite3_finalize(query);
}

// Steps and reads the columns: what the values are, without putting them anywhere.
ub8 FetchBare(const Bare& bare) {
    sqlite3_stmt* query = bare.Prepare("select id, price, name, day, note from t");
    ub8 rows = 0;
    volatile ub8 sink = 0;
    while (sqlite3_step(query) == SQLITE_ROW) {
        ub8 sum = static_cast<ub8>(sqlite3_column_int64(query, 0)) + static_cast<ub8>(sqlite3_column_double(query, 1));
        for (int column = 2; column < 5; ++column) {
            const unsigned char* text = sqlite3_column_text(query, column);
            sum += static_cast<ub8>(sqlite3_column_bytes(query, column)) + (text ? text[0] : 0);
        }
        sink = sink + sum;
        ++rows;
    }
    sqlite3_finalize(query);
    return rows;
}

// ---- In pieces: two texts a row, each into a buffer that takes it in one

const char* const kTexts = "select name, note from t";
constexpr ub4 kRoom = 1000;

// The place of the next piece, and what came into the last one.
struct Piece {
    char buffer[kRoom];
    ub4 length = 0;
    sb2 indicator = 0;
    ub2 code = 0;
    ub8 bytes = 0;

    static sb4 Place(dvoid* context, OCIDefine*, ub4, dvoid** buffer, ub4** length, ub1*, dvoid** indicator, ub2** code) {
        auto& self = *static_cast<Piece*>(context);
        self.bytes += self.length;
        self.length = kRoom;
        *buffer = self.buffer, *length = &self.length, *indicator = &self.indicator, *code = &self.code;
        return OCI_CONTINUE;
    }
};

void StartPieces(const Session& session, Piece& piece, bool by_callback) {
    session.Prepare(kTexts);
    for (const ub4 position : {1, 2}) {
        OCIDefine* define = nullptr;
        session.Check(OCIDefineByPos(session.stmt, &define, session.err, position, nullptr, 1, SQLT_CHR, nullptr,
                                     nullptr, nullptr, OCI_DYNAMIC_FETCH));
        if (by_callback) session.Check(OCIDefineDynamic(define, session.err, &piece, Piece::Place));
    }
    session.Check(OCIStmtExecute(session.svc, session.stmt, session.err, 0, 0, nullptr, nullptr, OCI_DEFAULT));
}

ub8 PiecesByCallback(const Session& session) {
    Piece piece;
    StartPieces(session, piece, true);
    for (sword rc = OCI_SUCCESS; rc == OCI_SUCCESS;) {
        rc = OCIStmtFetch2(session.stmt, session.err, kBatch, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
        session.Check(rc);
    }
    return piece.bytes + piece.length;
}

ub8 PiecesByPolling(const Session& session) {
    Piece piece;
    StartPieces(session, piece, false);
    for (sword rc = OCI_SUCCESS; rc != OCI_NO_DATA;) {
        rc = OCIStmtFetch2(session.stmt, session.err, 1, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
        piece.bytes += piece.length;
        piece.length = 0;
        if (rc != OCI_NEED_DATA) {
            session.Check(rc);
            continue;
        }
        dvoid* handle = nullptr;
        ub4 type = 0, iteration = 0, index = 0;
        ub1 direction = 0, wanted = 0;
        session.Check(OCIStmtGetPieceInfo(session.stmt, session.err, &handle, &type, &direction, &iteration, &index, &wanted));
        piece.length = kRoom;
        session.Check(OCIStmtSetPieceInfo(handle, type, session.err, piece.buffer, &piece.length, wanted,
                                          &piece.indicator, &piece.code));
    }
    return piece.bytes;
}

ub8 PiecesBare(const Bare& bare) {
    sqlite3_stmt* query = bare.Prepare(kTexts);
    char buffer[kRoom];
    ub8 bytes = 0;
    while (sqlite3_step(query) == SQLITE_ROW) {
        for (int column = 0; column < 2; ++column) {
            const unsigned char* text = sqlite3_column_text(query, column);
            const int length = sqlite3_column_bytes(query, column);
            if (text) std::memcpy(buffer, text, static_cast<size_t>(length));
            bytes += static_cast<ub8>(length);
        }
    }
    sqlite3_finalize(query);
    return bytes;
}

// A pool of one session that is there before anybody asks for it.
class WarmPool {
public:
    explicit WarmPool(const std::string& database) : session_(":memory:"), database_(database) {
        OCIHandleAlloc(session_.env, reinterpret_cast<dvoid**>(&pool_), OCI_HTYPE_SPOOL, 0, nullptr);
        session_.Check(OCISessionPoolCreate(session_.env, session_.err, pool_, &name_, &length_, Text(database_),
                                            Size(database_), 1, 1, 1, Text(kUser), Size(kUser), Text(kPassword),
                                            Size(kPassword), OCI_SPC_HOMOGENEOUS));
    }
    void GetAndRelease() {
        OCISvcCtx* svc = nullptr;
        session_.Check(OCISessionGet(session_.env, session_.err, &svc, nullptr, name_, length_, nullptr, 0, nullptr,
                                     nullptr, nullptr, OCI_SESSGET_SPOOL));
        session_.Check(OCISessionRelease(svc, session_.err, nullptr, 0, OCI_DEFAULT));
    }
    void LogOnAndOff() {
        OCISvcCtx* svc = nullptr;
        session_.Check(OCILogon(session_.env, session_.err, &svc, Text(kUser), Size(kUser), Text(kPassword),
                                Size(kPassword), Text(database_), Size(database_)));
        session_.Check(OCILogoff(svc, session_.err));
        OCIHandleFree(svc, OCI_HTYPE_SVCCTX);
    }

private:
    static inline const std::string kUser = "ann", kPassword = "secret";
    static OraText* Text(const std::string& text) {
        return reinterpret_cast<OraText*>(const_cast<char*>(text.c_str()));
    }
    static ub4 Size(const std::string& text) { return static_cast<ub4>(text.size()); }

    Session session_;
    std::string database_;
    OCISPool* pool_ = nullptr;
    OraText* name_ = nullptr;
    ub4 length_ = 0;
};

// ---- Large objects: one value, written and read in pieces of 64 KB

constexpr ub4 kLobPiece = 65536;
constexpr ub8 kLobPieces = 512;

struct LobKind {
    const char* name;
    const char* empty;
    ub2 type;
};
constexpr LobKind kBlob{"blob", "x''", SQLT_BLOB}, kClob{"clob", "''", SQLT_CLOB};
const char* const kUpdate = " for update";

// Whole characters, some of them of two bytes: they serve as binary data, too.
std::string LobData() {
    std::string data;
    while (data.size() < kLobPiece) data += "thirty bytes in plain letters, \xC3\xA4";
    data.resize(kLobPiece - 2);
    return data += "ok";
}

// A table of its own for each kind, with one row.
void CreateLobs(const Bare& bare) {
    bare.Run("create table of_blob(v blob)");
    bare.Run("create table of_clob(v clob)");
    bare.Run("insert into of_blob values(x'')");
    bare.Run("insert into of_clob values('')");
}

class LobOfLibrary {
public:
    LobOfLibrary(const Session& session, LobKind kind) : session_(session), kind_(kind) {
        OCIDescriptorAlloc(session.env, reinterpret_cast<dvoid**>(&lob_), OCI_DTYPE_LOB, 0, nullptr);
    }
    ~LobOfLibrary() { OCIDescriptorFree(lob_, OCI_DTYPE_LOB); }
    LobOfLibrary(const LobOfLibrary&) = delete;
    LobOfLibrary& operator=(const LobOfLibrary&) = delete;

    // Grows from nothing.
    void Write() {
        session_.Execute((std::string("update of_") + kind_.name + " set v = " + kind_.empty).c_str());
        Fetch(kUpdate);
        for (ub8 done = 1; done <= kLobPieces; ++done) {
            ub4 amount = 0;
            const ub1 piece = done == 1 ? OCI_FIRST_PIECE : done < kLobPieces ? OCI_NEXT_PIECE : OCI_LAST_PIECE;
            const sword rc = OCILobWrite(session_.svc, session_.err, lob_, &amount, 1, data_.data(), kLobPiece, piece,
                                         nullptr, nullptr, 0, SQLCS_IMPLICIT);
            if (rc != OCI_NEED_DATA) session_.Check(rc);
        }
        session_.Check(OCITransCommit(session_.svc, session_.err, OCI_DEFAULT));
    }
    // Outside of a transaction the fetch keeps a copy, so that it is read as it was.
    ub8 Read(const char* ending) {
        Fetch(ending);
        ub8 bytes = 0;
        for (sword rc = OCI_NEED_DATA; rc == OCI_NEED_DATA;) {
            ub4 amount = 0;
            rc = OCILobRead(session_.svc, session_.err, lob_, &amount, 1, data_.data(), kLobPiece, nullptr, nullptr, 0,
                            SQLCS_IMPLICIT);
            if (rc != OCI_NEED_DATA) session_.Check(rc);
            bytes += amount;
        }
        session_.Check(OCITransCommit(session_.svc, session_.err, OCI_DEFAULT));
        return bytes;
    }

private:
    void Fetch(const char* ending) {
        session_.Prepare((std::string("select v from of_") + kind_.name + ending).c_str());
        OCIDefine* define = nullptr;
        session_.Check(OCIDefineByPos(session_.stmt, &define, session_.err, 1, &lob_, -1, kind_.type, nullptr, nullptr,
                                      nullptr, OCI_DEFAULT));
        session_.Check(OCIStmtExecute(session_.svc, session_.stmt, session_.err, 1, 0, nullptr, nullptr, OCI_DEFAULT));
    }
    const Session& session_;
    const LobKind kind_;
    OCILobLocator* lob_ = nullptr;
    std::string data_ = LobData();
};

template <class Move>
void LobBare(const Bare& bare, LobKind kind, bool writes, Move move) {
    sqlite3_blob* blob = nullptr;
    const std::string table = std::string("of_") + kind.name;
    bare.Run("begin");
    if (writes) bare.Run(("update " + table + " set v = zeroblob(512 * 65536)").c_str());
    if (sqlite3_blob_open(bare.database, "main", table.c_str(), "v", 1, writes, &blob) != SQLITE_OK) Fail("no value");
    for (ub8 done = 0; done < kLobPieces; ++done)
        if (move(blob, static_cast<int>(done * kLobPiece)) != SQLITE_OK) Fail(sqlite3_errmsg(bare.database));
    sqlite3_blob_close(blob);
    bare.Run("commit");
}

void PairLobs(const std::string& folder, int runs) {
    const std::string file = folder + "/lobs.db";
    const Bare bare(folder + "/bare_lobs.db");
    CreateLobs(bare);
    CreateLobs(Bare(file));
    const Session session(file);
    std::string data = LobData();
    for (const LobKind kind : {kBlob, kClob}) {
        LobOfLibrary lob(session, kind);
        const auto title = [&](const char* what) { return std::string(kind.name) + " of 32 MB " + what + " / bare blob"; };
        const auto write = [&](sqlite3_blob* blob, int at) { return sqlite3_blob_write(blob, data.data(), kLobPiece, at); };
        const auto read = [&](sqlite3_blob* blob, int at) { return sqlite3_blob_read(blob, data.data(), kLobPiece, at); };
        const auto whole = [](ub8 bytes) { if (bytes != kLobPieces * kLobPiece) Fail("not every byte came back"); };
        Pair(title("written by 64 KB").c_str(), 2.0, runs, [&] { lob.Write(); }, [&] { LobBare(bare, kind, true, write); });
        Pair(title("read by 64 KB").c_str(), 2.0, runs,
             [&] { whole(lob.Read(kUpdate)); }, [&] { LobBare(bare, kind, false, read); });
        Pair(title("copied at fetch, read").c_str(), 2.0, runs,
             [&] { whole(lob.Read("")); }, [&] { LobBare(bare, kind, false, read); });
    }
}

void Run(const std::string& folder, int runs) {
    WarmPool pool(folder + "/pool.db");
    const auto times = [](int count, auto work) { for (int done = 0; done < count; ++done) work(); };
    constexpr int kLogons = 20;
    Pair("logon and logoff / get and release, at least", 100, runs,
         [&] { times(kLogons, [&] { pool.LogOnAndOff(); }); },
         [&] { times(kLogons, [&] { pool.GetAndRelease(); }); });
    const std::string ours = folder + "/ours.db";
    const std::string theirs = folder + "/theirs.db";
    Pair("array insert of 200,000 rows by 1,000 / bare loop", 1.5, runs,
         [&] { Remove(ours); InsertThroughLibrary(ours); }, [&] { Remove(theirs); InsertBare(theirs); });
    Session session(ours);
    const Bare bare(theirs);
    const auto all = [](ub8 rows) { if (rows != kRows) Fail("not every row came back"); };
    Pair("array define of 200,000 rows by 1,000 / bare loop", 2.0, runs,
         [&] { all(FetchThroughLibrary(session)); }, [&] { all(FetchBare(bare)); });
    const std::string cursors = folder + "/cursors.db";
    Pair("oexn of 200,000 rows by 1,000 / OCIStmtExecute", 1.1, runs, [&] { Remove(cursors); InsertThroughCursor(cursors); },
         [&] { Remove(cursors); InsertThroughLibrary(cursors); });
    CursorSession cursor(ours);
    Pair("ofen of 200,000 rows by 1,000 / OCIStmtFetch2", 1.1, runs, [&] { all(FetchThroughCursor(cursor)); },
         [&] { all(FetchThroughLibrary(session)); });
    const ub8 bytes = PiecesBare(bare);
    const auto whole = [bytes](ub8 fetched) { if (fetched != bytes) Fail("not every byte came back"); };
    Pair("pieces of 200,000 rows by callback / bare loop", 3.0, runs,
         [&] { whole(PiecesByCallback(session)); }, [&] { whole(PiecesBare(bare)); });
    Pair("pieces of 200,000 rows by polling / bare loop", 3.0, runs,
         [&] { whole(PiecesByPolling(session)); }, [&] { whole(PiecesBare(bare)); });
    PairLobs(folder, runs);
}

}  // namespace

int main(int argc, char** argv) try {
    char folder[] = "/tmp/harnix-bench-XXXXXX";
    if (!mkdtemp(folder)) Fail("no temporary folder");
    Run(folder, argc > 1 ? std::max(1, std::atoi(argv[1])) : 5);
    fs::remove_all(folder);
    return 0;
} catch (const std::exception& failure) {
    std::fprintf(stderr, "client_bench: %s\n", failure.what());
    return 1;
}
