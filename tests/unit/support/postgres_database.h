// A fresh database on the private cluster of the test run, with an owner that needs a password; gone with its object.
// The cluster is the one of KELP_POSTGRES, or the one whose URL lies in the file that KELP_POSTGRES_FILE names: without
// either the test fails.
#pragma once

#include <gtest/gtest.h>
#include <libpq-fe.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <memory>
#include <string>
#include <string_view>

inline std::string ClusterUrl() {
    const char* const given = std::getenv("KELP_POSTGRES");
    if (given && *given) return given;
    const char* const file = std::getenv("KELP_POSTGRES_FILE");
    std::string url;
    if (file) std::getline(std::ifstream(file), url);
    return url;
}

class PostgresDatabase {
public:
    PostgresDatabase() : cluster_(ClusterUrl()) {
        static int count = 0;
        name_ = "t" + std::to_string(getpid()) + "_" + std::to_string(++count);
        EXPECT_NE(cluster_, "") << "no PostgreSQL cluster: run this with tools/cluster run";
        Run("create role \"ann_" + name_ + "\" login password 'secret'");
        Run("create database \"" + name_ + "\" template template0 owner \"ann_" + name_ + "\"");
    }
    ~PostgresDatabase() {
        Run("drop database \"" + name_ + "\" with (force)");
        Run("drop role \"ann_" + name_ + "\"");
    }
    PostgresDatabase(const PostgresDatabase&) = delete;
    PostgresDatabase& operator=(const PostgresDatabase&) = delete;

    [[nodiscard]] std::string Url() const {
        const std::size_t place = cluster_.find("/postgres?");
        return place == std::string::npos ? cluster_ : cluster_.substr(0, place + 1) + name_ + cluster_.substr(place + 9);
    }
    [[nodiscard]] std::string Owner() const { return "ann_" + name_; }    // whose password is secret
    // As the superuser, on the cluster's own database, or in this one; answers the first value.
    std::string Run(const std::string& sql) const { return Run(cluster_, sql); }
    std::string RunHere(const std::string& sql) const { return Run(Url(), sql); }

private:
    static std::string Run(const std::string& url, const std::string& sql) {
        PGconn* const connection = PQconnectdb(url.c_str());
        PQsetNoticeProcessor(connection, [](void*, const char*) {}, nullptr);
        PGresult* const result = PQexec(connection, sql.c_str());
        const ExecStatusType status = PQresultStatus(result);
        EXPECT_TRUE(status == PGRES_COMMAND_OK || status == PGRES_TUPLES_OK) << sql << ": " << PQerrorMessage(connection);
        std::string value = PQntuples(result) > 0 ? PQgetvalue(result, 0, 0) : "";
        PQclear(result);
        PQfinish(connection);
        return value;
    }

    std::string cluster_, name_;
};

// Functions of the embedded engine's own that the tests ask with, for the server.
inline constexpr const char* kEmbeddedFunctions =
    "create function join_texts(text, text, text) returns text language sql immutable as"
    " $$ select case when $2 is null or $1 is null then coalesce($1, $2) else concat($1, $3, $2) end $$;"
    "create function join_texts(text, text) returns text language sql immutable as $$ select join_texts($1, $2, ',') $$;"
    "create aggregate group_concat(text) (sfunc = join_texts, stype = text);"
    "create aggregate group_concat(text, text) (sfunc = join_texts, stype = text);"
    "create function join_numbers(text, numeric) returns text language sql immutable as"
    " $$ select join_texts($1, $2::text) $$;"
    "create aggregate group_concat(numeric) (sfunc = join_numbers, stype = text);"
    "create function hex(bytea) returns text language sql immutable as $$ select upper(encode($1, 'hex')) $$;"
    "create function hex(text) returns text language sql immutable as $$ select hex(convert_to($1, 'UTF8')) $$;"
    "create function zeroblob(int) returns bytea language sql immutable as $$ select decode(repeat('00', $1), 'hex') $$;"
    "create function printf(text, int, text) returns text language sql immutable as $$ select repeat($3, $2) $$;"
    "create function quote(text) returns text language sql immutable as $$ select quote_nullable($1) $$;"
    "create function quote(timestamp) returns text language sql stable as $$ select quote_nullable($1::text) $$;"
    "do $$ declare t text; begin foreach t in array array['bigint', 'numeric', 'float8', 'tid', 'refcursor'] loop"
    " execute format('create function quote(%s) returns text language sql immutable as ''select $1::text''', t); end loop; end $$;"
    "create function quote(bytea) returns text language sql immutable as $$ select 'X' || quote_literal(hex($1)) $$";

// Such a database with those, where KELP_TEST_ENGINE has a test run on the server; else null.
inline std::unique_ptr<PostgresDatabase> ServerOfTheTest() {
    const char* const engine = std::getenv("KELP_TEST_ENGINE");
    if (!engine || std::string_view(engine) != "postgres") return nullptr;
    auto server = std::make_unique<PostgresDatabase>();
    server->RunHere(kEmbeddedFunctions);
    return server;
}
