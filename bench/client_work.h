// Work that is measured on every engine: a session, 200,000 rows inserted by array binds and fetched by array defines, and
// the pairing of our seconds with those of the same work on the engine's own interface.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstring>
#include <stdexcept>
#include <string>
#include <vector>

#include "oci.h"

constexpr ub4 kRows = 200000;
constexpr ub4 kBatch = 1000;

[[noreturn]] inline void Fail(const std::string& what) { throw std::runtime_error(what); }

template <class Work>
double Seconds(Work work) {
    const auto start = std::chrono::steady_clock::now();
    work();
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

// Both in turn, once to warm up; the median of the ratios pair by pair.
template <class Ours, class Theirs>
void Pair(const char* what, double goal, int runs, Ours ours, Theirs theirs) {
    std::vector<double> ratios;
    for (int run = -1; run < runs; ++run) {
        const double mine = Seconds(ours);
        const double bare = Seconds(theirs);
        if (run >= 0) ratios.push_back(mine / bare);
    }
    std::sort(ratios.begin(), ratios.end());
    std::printf("%-58s %6.2f x  (goal %.1f)\n", what, ratios[ratios.size() / 2], goal);
    std::fflush(stdout);
}

struct Session {
    OCIEnv* env = nullptr;
    OCIError* err = nullptr;
    OCISvcCtx* svc = nullptr;
    OCIStmt* stmt = nullptr;

    explicit Session(const std::string& database) {
        if (OCIEnvCreate(&env, OCI_DEFAULT, nullptr, nullptr, nullptr, nullptr, 0, nullptr) != OCI_SUCCESS)
            Fail("no environment");
        OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&err), OCI_HTYPE_ERROR, 0, nullptr);
        OCIHandleAlloc(env, reinterpret_cast<dvoid**>(&stmt), OCI_HTYPE_STMT, 0, nullptr);
        Check(OCILogon(env, err, &svc, nullptr, 0, nullptr, 0, reinterpret_cast<const OraText*>(database.c_str()),
                       static_cast<ub4>(database.size())));
    }
    ~Session() {
        OCILogoff(svc, err);
        OCIHandleFree(env, OCI_HTYPE_ENV);
    }
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;

    void Check(sword rc) const {
        if (rc == OCI_SUCCESS || rc == OCI_NO_DATA) return;
        char text[1024] = "?";
        sb4 code = 0;
        OCIErrorGet(err, 1, nullptr, &code, reinterpret_cast<OraText*>(text), sizeof text, OCI_HTYPE_ERROR);
        Fail(text);
    }
    void Prepare(const char* sql) const {
        Check(OCIStmtPrepare(stmt, err, reinterpret_cast<const OraText*>(sql), static_cast<ub4>(std::strlen(sql)),
                             OCI_NTV_SYNTAX, OCI_DEFAULT));
    }
    void Execute(const char* sql) const {
        Prepare(sql);
        Check(OCIStmtExecute(svc, stmt, err, 1, 0, nullptr, nullptr, OCI_DEFAULT));
    }
};

// A column of a batch: values side by side with indicators, lengths and return codes, as an application keeps them.
struct Buffer {
    ub2 type;
    sb4 size;
    std::vector<char> data = std::vector<char>(static_cast<size_t>(size) * kBatch);
    std::vector<sb2> indicators = std::vector<sb2>(kBatch);
    std::vector<ub2> lengths = std::vector<ub2>(kBatch);
    std::vector<ub2> codes = std::vector<ub2>(kBatch);

    char* At(ub4 row) { return data.data() + static_cast<size_t>(size) * row; }
};

inline std::vector<Buffer> Buffers() { return {{SQLT_INT, 8}, {SQLT_FLT, 8}, {SQLT_CHR, 20}, {SQLT_DAT, 7}, {SQLT_CHR, 40}}; }

inline void FillBatch(std::vector<Buffer>& buffers, ub4 first) {
    for (ub4 row = 0; row < kBatch; ++row) {
        const sb8 id = static_cast<sb8>(first) + row + 1;
        const double price = static_cast<double>(id) * 1.25;
        std::memcpy(buffers[0].At(row), &id, sizeof id);
        std::memcpy(buffers[1].At(row), &price, sizeof price);
        const int name_length = std::snprintf(buffers[2].At(row), 20, "name of row %07d", static_cast<int>(id));
        buffers[2].lengths[row] = static_cast<ub2>(name_length);
        const auto month = static_cast<unsigned char>(1 + id % 12);
        const unsigned char day[7] = {120, 126, month, static_cast<unsigned char>(1 + id % 28), 1, 1, 1};
        std::memcpy(buffers[3].At(row), day, sizeof day);
        buffers[4].indicators[row] = id % 3 == 0 ? -1 : 0;
        const int note_length = std::snprintf(buffers[4].At(row), 40, "a note for row %d", static_cast<int>(id));
        buffers[4].lengths[row] = static_cast<ub2>(note_length);
    }
}

inline const char* const kTable =
    "create table t(id integer, price number(12,2), name varchar2(20), day date, note varchar2(40))";

inline void InsertThroughLibrary(const std::string& file) {
    Session session(file);
    session.Execute(kTable);
    session.Prepare("insert into t values(:1, :2, :3, :4, :5)");
    std::vector<Buffer> buffers = Buffers();
    for (ub4 position = 1; position <= buffers.size(); ++position) {
        Buffer& buffer = buffers[position - 1];
        OCIBind* bind = nullptr;
        session.Check(OCIBindByPos(session.stmt, &bind, session.err, position, buffer.data.data(), buffer.size,
                                   buffer.type, buffer.indicators.data(),
                                   buffer.type == SQLT_CHR ? buffer.lengths.data() : nullptr,
                                   buffer.codes.data(), 0, nullptr, OCI_DEFAULT));
    }
    for (ub4 first = 0; first < kRows; first += kBatch) {
        FillBatch(buffers, first);
        session.Check(OCIStmtExecute(session.svc, session.stmt, session.err, kBatch, 0, nullptr, nullptr, OCI_DEFAULT));
    }
}

inline ub8 FetchThroughLibrary(Session& session) {
    session.Prepare("select id, price, name, day, note from t");
    std::vector<Buffer> buffers = Buffers();
    for (ub4 position = 1; position <= buffers.size(); ++position) {
        Buffer& buffer = buffers[position - 1];
        OCIDefine* define = nullptr;
        session.Check(OCIDefineByPos(session.stmt, &define, session.err, position, buffer.data.data(), buffer.size,
                                     buffer.type, buffer.indicators.data(), buffer.lengths.data(),
                                     buffer.codes.data(), OCI_DEFAULT));
    }
    session.Check(OCIStmtExecute(session.svc, session.stmt, session.err, 0, 0, nullptr, nullptr, OCI_DEFAULT));
    ub8 rows = 0;
    for (sword rc = OCI_SUCCESS; rc == OCI_SUCCESS;) {
        rc = OCIStmtFetch2(session.stmt, session.err, kBatch, OCI_FETCH_NEXT, 0, OCI_DEFAULT);
        session.Check(rc);
        ub4 fetched = 0;
        OCIAttrGet(session.stmt, OCI_HTYPE_STMT, &fetched, nullptr, OCI_ATTR_ROWS_FETCHED, session.err);
        rows += fetched;
    }
    return rows;
}
