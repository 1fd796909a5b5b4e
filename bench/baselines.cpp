// The yardsticks of the driver: loops that make the same writes by hand, nothing else. One program, chosen by its first
// argument, so that start-up costs the same for all:
//   echo           read a line, write prompt and echo
//   result         the same, and a result line
//   trace          the same, with a trace line and a result line
//   sqlite FILE    print every row of table t of a database, a write a row, as FetchAllOCI lays it out
#include <sqlite3.h>

#include <cstdio>
#include <cstring>
#include <string>

namespace {

char line[10000];

void Put(const char* text) {
    std::fputs(text, stdout);
    std::fflush(stdout);
}

int Loop(std::initializer_list<const char*> results) {
    for (;;) {
        Put("> ");
        if (!std::fgets(line, sizeof line, stdin)) break;
        Put(line);
        for (const char* result : results) Put(result);
    }
    Put("\n");
    return 0;
}

int PrintRows(const char* file) {
    sqlite3* database = nullptr;
    sqlite3_stmt* query = nullptr;
    if (sqlite3_open(file, &database) != SQLITE_OK ||
        sqlite3_prepare_v2(database, "select id, price, name, day, note from t", -1, &query, nullptr) != SQLITE_OK) {
        std::fprintf(stderr, "baselines: %s\n", sqlite3_errmsg(database));
        return 1;
    }
    std::string row;
    while (sqlite3_step(query) == SQLITE_ROW) {
        row.clear();
        for (int column = 0; column < 5; ++column) {
            if (column > 0) row += ',';
            const auto* text = reinterpret_cast<const char*>(sqlite3_column_text(query, column));
            row += text ? text : "-";
        }
        row += '\n';
        Put(row.c_str());
    }
    sqlite3_finalize(query);
    return sqlite3_close(database) == SQLITE_OK ? 0 : 1;
}

}  // namespace

int main(int argc, char** argv) {
    const std::string what = argc > 1 ? argv[1] : "";
    if (what == "echo") return Loop({});
    if (what == "result") return Loop({"SetCallErrorOCI set to 1\n"});
    if (what == "trace") return Loop({"OCINumberAdd\n", "42\n"});
    if (what == "sqlite" && argc == 3) return PrintRows(argv[2]);
    return 2;
}
