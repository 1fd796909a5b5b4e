// The same on PostgreSQL, beside libpq in the same run: rows inserted by array binds beside a pipelined loop, rows fetched
// beside single-row mode, round trips, and branches prepared and committed. Of the fetch, how much memory it took, too. Run it with tools/cluster run.
//   postgres_bench [runs]
#include <libpq-fe.h>
#include <sys/resource.h>

#include <cstdlib>

#include "client_work.h"
#include "legacy_work.h"
#include "xa.h"

namespace {

constexpr int kTrips = 5000;

struct Bare {
    PGconn* connection;
    explicit Bare(const std::string& url) : connection(PQconnectdb(url.c_str())) {
        if (PQstatus(connection) != CONNECTION_OK) Fail(PQerrorMessage(connection));
        PQsetNoticeProcessor(connection, [](void*, const char*) {}, nullptr);
    }
    ~Bare() { PQfinish(connection); }
    Bare(const Bare&) = delete;
    Bare& operator=(const Bare&) = delete;

    void Run(const char* sql) const { Check(PQexec(connection, sql)); }
    void Check(PGresult* result) const {
        if (PQresultStatus(result) == PGRES_FATAL_ERROR) Fail(PQresultErrorMessage(result));
        PQclear(result);
    }
};

template <class T>
void PutReversed(const T& value, char* to) {
    const char* bytes = reinterpret_cast<const char*>(&value);
    for (std::size_t i = 0; i < sizeof value; ++i) to[i] = bytes[sizeof value - 1 - i];
}

// What the library's table is in the server's own words.
const char* const kBareTable =
    "create table t(id numeric(38), price numeric(12,2), name varchar(20), day timestamp(0), note varchar(40))";

void InsertBare(const Bare& bare) {
    bare.Run("drop table if exists t");
    bare.Run(kBareTable);
    const Oid types[] = {20, 701, 1043, 1114, 1043};
    bare.Check(PQprepare(bare.connection, "i", "insert into t values($1, $2, $3, $4, $5)", 5, types));
    std::vector<Buffer> buffers = Buffers();
    bare.Run("begin");
    PQenterPipelineMode(bare.connection);
    for (ub4 first = 0; first < kRows; first += kBatch) {
        FillBatch(buffers, first);
        for (ub4 row = 0; row < kBatch; ++row) {
            char id[8], price[8], day[8];
            PutReversed(*reinterpret_cast<sb8*>(buffers[0].At(row)), id);
            PutReversed(*reinterpret_cast<double*>(buffers[1].At(row)), price);
            PutReversed(static_cast<sb8>(first) * 86400, day);
            const char* values[] = {id, price, buffers[2].At(row), day,
                                    buffers[4].indicators[row] < 0 ? nullptr : buffers[4].At(row)};
            const int lengths[] = {8, 8, buffers[2].lengths[row], 8, buffers[4].lengths[row]};
            const int formats[] = {1, 1, 1, 1, 1};
            if (PQsendQueryPrepared(bare.connection, "i", 5, values, lengths, formats, 1) != 1)
                Fail(PQerrorMessage(bare.connection));
        }
        PQpipelineSync(bare.connection);
        for (ExecStatusType status = PGRES_COMMAND_OK; status != PGRES_PIPELINE_SYNC;) {
            PGresult* result = PQgetResult(bare.connection);
            if (result) status = PQresultStatus(result);
            if (result) bare.Check(result);
        }
    }
    PQexitPipelineMode(bare.connection);
    bare.Run("commit");
    bare.Run("deallocate i");
}

ub8 FetchBare(const Bare& bare) {
    ub8 rows = 0, bytes = 0;
    PQsendQueryParams(bare.connection, "select id, price, name, day, note from t", 0, nullptr, nullptr, nullptr, nullptr, 1);
    PQsetSingleRowMode(bare.connection);
    while (PGresult* result = PQgetResult(bare.connection)) {
        rows += static_cast<ub8>(PQntuples(result));
        for (int column = 0; PQntuples(result) > 0 && column < 5; ++column) {
            if (!PQgetisnull(result, 0, column)) bytes += static_cast<ub8>(PQgetvalue(result, 0, column)[0]);
        }
        bare.Check(result);
    }
    return bytes == 1 ? 0 : rows;
}

long MostMemory() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

// A branch of a global transaction in which a row changes: prepared, then committed.
void PrepareAndCommit(const Session& session, int pairs) {
    OCITrans* trans = nullptr;
    OCIHandleAlloc(session.env, reinterpret_cast<dvoid**>(&trans), OCI_HTYPE_TRANS, 0, nullptr);
    session.Check(OCIAttrSet(session.svc, OCI_HTYPE_SVCCTX, trans, 0, OCI_ATTR_TRANS, session.err));
    session.Prepare("insert into t(id) values(1)");
    for (int pair = 0; pair < pairs; ++pair) {
        XID xid{.formatID = 7, .gtrid_length = sizeof pair, .bqual_length = 1, .data = {}};
        std::memcpy(xid.data, &pair, sizeof pair);
        session.Check(OCIAttrSet(trans, OCI_HTYPE_TRANS, &xid, sizeof xid, OCI_ATTR_XID, session.err));
        session.Check(OCITransStart(session.svc, session.err, 60, OCI_TRANS_NEW));
        session.Check(OCIStmtExecute(session.svc, session.stmt, session.err, 1, 0, nullptr, nullptr, OCI_DEFAULT));
        session.Check(OCITransPrepare(session.svc, session.err, OCI_DEFAULT));
        session.Check(OCITransCommit(session.svc, session.err, OCI_TRANS_TWOPHASE));
    }
    session.Check(OCIAttrSet(session.svc, OCI_HTYPE_SVCCTX, nullptr, 0, OCI_ATTR_TRANS, session.err));
    OCIHandleFree(trans, OCI_HTYPE_TRANS);
}

void Measure(int runs) {
    const char* const url = std::getenv("KELP_POSTGRES");
    if (!url) Fail("no cluster: run this with tools/cluster run");
    const Bare bare(url);
    InsertBare(bare);
    {
        Session session(url);
        const long before = MostMemory();
        if (FetchThroughLibrary(session) != kRows) Fail("rows are missing");
        std::printf("%-58s %6ld KB\n", "PostgreSQL: memory of a fetch of 200,000 rows", MostMemory() - before);
    }
    Pair("PostgreSQL: insert by arrays / pipelined libpq", 1.0, runs,
         [&] {
             bare.Run("drop table if exists t");
             InsertThroughLibrary(url);
         },
         [&] { InsertBare(bare); });
    Session session(url);
    Pair("PostgreSQL: fetch into arrays / single-row mode", 1.5, runs, [&] { FetchThroughLibrary(session); },
         [&] { FetchBare(bare); });
    Pair("PostgreSQL: oexn / OCIStmtExecute", 1.1, runs,
         [&] {
             bare.Run("drop table if exists t");
             InsertThroughCursor(url);
         },
         [&] {
             bare.Run("drop table if exists t");
             InsertThroughLibrary(url);
         });
    CursorSession cursor(url);
    Pair("PostgreSQL: ofen / OCIStmtFetch2", 1.1, runs, [&] { FetchThroughCursor(cursor); },
         [&] { FetchThroughLibrary(session); });
    Pair("PostgreSQL: OCIPing / empty query", 1.2, runs,
         [&] {
             for (int trip = 0; trip < kTrips; ++trip) session.Check(OCIPing(session.svc, session.err, OCI_DEFAULT));
         },
         [&] {
             for (int trip = 0; trip < kTrips; ++trip) bare.Run("");
         });
    Pair("PostgreSQL: one row inserted and committed / libpq", 1.2, runs,
         [&] {
             session.Prepare("insert into t(id) values(1)");
             for (int trip = 0; trip < kTrips / 5; ++trip) {
                 session.Check(OCIStmtExecute(session.svc, session.stmt, session.err, 1, 0, nullptr, nullptr, OCI_DEFAULT));
                 session.Check(OCITransCommit(session.svc, session.err, OCI_DEFAULT));
             }
         },
         [&] {
             for (int trip = 0; trip < kTrips / 5; ++trip)
                 for (const char* sql : {"begin", "insert into t(id) values(1)", "commit"}) bare.Run(sql);
         });
    Pair("PostgreSQL: a branch prepared and committed / libpq", 1.2, runs, [&] { PrepareAndCommit(session, kTrips / 5); },
         [&] {
             for (int pair = 0; pair < kTrips / 5; ++pair)
                 for (const char* sql : {"begin", "insert into t(id) values(1)", "prepare transaction 'pair'",
                                         "commit prepared 'pair'"})
                     bare.Run(sql);
         });
}

}  // namespace

int main(int count, char** words) try {
    Measure(count > 1 ? std::atoi(words[1]) : 5);
    return 0;
} catch (const std::exception& error) {
    std::fprintf(stderr, "%s\n", error.what());
    return 1;
}
