// A fresh database on the private cluster of the test run, with an owner that needs a password; gone with its object.
// The cluster is the one of KELP_POSTGRES, or the one whose URL lies in the file that KELP_POSTGRES_FILE names: without
// either the test fails.
#pragma once

#include <gtest/gtest.h>
#include <libpq-fe.h>
#include <unistd.h>

#include <cstdlib>
#include <fstream>
#include <string>

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
