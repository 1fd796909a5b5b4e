// The work of client_work.h through the version-7 calls.
#pragma once

#include "client_work.h"
#include "oci_legacy.h"

struct CursorSession {
    ub1 host[HDA_SIZE] = {};
    Lda_Def login{};
    Cda_Def cursor{};

    explicit CursorSession(const std::string& database) {
        Check(olog(&login, host, nullptr, 0, nullptr, 0, Text(database.c_str()), -1, OCI_LM_DEF));
        Check(oopen(&cursor, &login, nullptr, -1, -1, nullptr, -1));
    }
    ~CursorSession() { ologof(&login); }
    CursorSession(const CursorSession&) = delete;
    CursorSession& operator=(const CursorSession&) = delete;

    static text* Text(const char* words) { return reinterpret_cast<text*>(const_cast<char*>(words)); }
    void Check(sword rc) {
        text words[512];
        if (rc == 0 || rc == 1403) return;
        oerhms(&login, static_cast<sb2>(rc), words, sizeof words);
        Fail(reinterpret_cast<const char*>(words));
    }
    void Parse(const char* sql) { Check(oparse(&cursor, Text(sql), -1, 1, 2)); }
};

inline void InsertThroughCursor(const std::string& database) {
    CursorSession session(database);
    session.Parse(kTable);
    session.Check(oexec(&session.cursor));
    session.Parse("insert into t values(:1, :2, :3, :4, :5)");
    std::vector<Buffer> buffers = Buffers();
    for (std::size_t index = 0; index < buffers.size(); ++index) {
        Buffer& buffer = buffers[index];
        const std::string name = ":" + std::to_string(index + 1);
        session.Check(obndra(&session.cursor, CursorSession::Text(name.c_str()), -1,
                             reinterpret_cast<ub1*>(buffer.data.data()), buffer.size, buffer.type, -1,
                             buffer.indicators.data(), buffer.type == SQLT_CHR ? buffer.lengths.data() : nullptr,
                             buffer.codes.data(), 0, nullptr, nullptr, -1, -1));
    }
    for (ub4 first = 0; first < kRows; first += kBatch) {
        FillBatch(buffers, first);
        session.Check(oexn(&session.cursor, kBatch, 0));
    }
}

inline ub8 FetchThroughCursor(CursorSession& session) {
    session.Parse("select id, price, name, day, note from t");
    std::vector<Buffer> buffers = Buffers();
    for (std::size_t index = 0; index < buffers.size(); ++index) {
        Buffer& buffer = buffers[index];
        session.Check(odefin(&session.cursor, static_cast<sword>(index + 1), reinterpret_cast<ub1*>(buffer.data.data()),
                             buffer.size, buffer.type, -1, buffer.indicators.data(), nullptr, -1, -1,
                             buffer.lengths.data(), buffer.codes.data()));
    }
    session.Check(oexec(&session.cursor));
    for (sword rc = 0; rc == 0;) {
        rc = ofen(&session.cursor, kBatch);
        session.Check(rc);
    }
    return session.cursor.rpc;
}
