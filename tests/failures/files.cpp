// A client library whose files fail: libkelpci, and SQLite's system calls behind its function fail_at(PLACE, KIND). KIND 1:
// the call at that place, of those that are counted from 1, fails; KIND 2: all from there on. PLACE 0: none any more.
// A write finds no room, anything else an input/output error.
#include <fcntl.h>
#include <sqlite3.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>

namespace {

int left = 0, kind = 0;

bool Fails(int error) {
    if (left == 0 || (left > 1 && --left > 0)) return false;
    if (kind == 1) left = 0;
    errno = error;
    return true;
}

sqlite3_vfs* Files() { return sqlite3_vfs_find(nullptr); }

// The system call of a name, failing with an error when it is its turn.
template <class Answer, class... Arguments>
struct Call {
    template <int number, int error>
    static Answer Failing(Arguments... arguments) {
        return Fails(error) ? Answer(-1) : real<number>(arguments...);
    }
    template <int number>
    static inline Answer (*real)(Arguments...) = nullptr;
    template <int number, int error>
    static void Replace(const char* name) {
        real<number> = reinterpret_cast<Answer (*)(Arguments...)>(Files()->xGetSystemCall(Files(), name));
        Files()->xSetSystemCall(Files(), name, reinterpret_cast<sqlite3_syscall_ptr>(&Failing<number, error>));
    }
};

void FailAt(sqlite3_context* context, int, sqlite3_value** values) {
    left = sqlite3_value_int(values[0]);
    kind = sqlite3_value_int(values[1]);
    sqlite3_result_int(context, 0);
}

int AddFunction(sqlite3* database, char**, const sqlite3_api_routines*) {
    sqlite3_exec(database, "pragma synchronous=off", nullptr, nullptr, nullptr);    // nobody pulls the plug
    return sqlite3_create_function(database, "fail_at", 2, SQLITE_UTF8, nullptr, FailAt, nullptr, nullptr);
}

[[gnu::constructor]] void Replace() {
    sqlite3_initialize();
    Call<int, const char*, int, int>::Replace<0, EIO>("open");
    Call<ssize_t, int, void*, size_t, off_t>::Replace<1, ESTALE>("pread64");
    Call<ssize_t, int, const void*, size_t, off_t>::Replace<2, ENOSPC>("pwrite64");
    Call<ssize_t, int, const void*, size_t>::Replace<3, ENOSPC>("write");
    Call<int, int, off_t>::Replace<4, EIO>("ftruncate");
    Call<int, const char*>::Replace<5, EIO>("unlink");
    Call<void*, void*, size_t, int, int, int, off_t>::Replace<6, ENOMEM>("mmap");
    sqlite3_auto_extension(reinterpret_cast<void (*)()>(AddFunction));
}

}  // namespace
