// Codes for numbers, numbers for codes, and the diagnostics of each thread.
#include "xa/answer.h"

#include <pthread.h>

#include <algorithm>
#include <cstring>
#include <map>
#include <memory>
#include <new>

#include "handles/error_handle.h"
#include "handles/errors.h"

namespace xa {
namespace {

struct Row {
    int code;
    int first, last;    // error numbers
};
constexpr Row kCodes[] = {
    {XA_OK, 0, 0},
    {XA_RBINTEGRITY, errors::kUnique, errors::kUnique},
    {XA_RBDEADLOCK, errors::kDeadlock, errors::kDeadlock},
    {XAER_RMFAIL, errors::kNotLoggedOn, errors::kNotLoggedOn},
    {XA_RBROLLBACK, errors::kRolledBack, errors::kRolledBack},
    {XA_RBINTEGRITY, errors::kCheckViolated, errors::kChildFound},
    {XAER_RMFAIL, errors::kEndOfChannel, errors::kNotConnected},
    {XAER_RMFAIL, 3135, 3135},
    {XAER_RMFAIL, 12150, 12699},
};
// Of branches alone.
constexpr Row kBranchCodes[] = {
    {XA_RBTIMEOUT, errors::kLockTimedOut, errors::kLockTimedOut},
    {XAER_NOTA, errors::kNoSuchTransaction, errors::kNoSuchTransaction},
    {XAER_DUPID, errors::kDuplicateXid, errors::kDuplicateXid},
    {XA_RBROLLBACK, errors::kBranchRolledBack, errors::kBranchRolledBack},
    {XA_RDONLY, errors::kBranchReadOnly, errors::kBranchReadOnly},
    {XAER_PROTO, errors::kCommitProtocol, errors::kCommitProtocol},
    {XAER_PROTO, errors::kMixedCoupling, errors::kMixedCoupling},
    {XAER_PROTO, errors::kAttachedElsewhere, errors::kAttachedElsewhere},
};

// The number of a code that came without one.
struct Meaning {
    int code;
    int number;
};
constexpr Meaning kNumbers[] = {
    {XA_RDONLY, errors::kBranchReadOnly}, {XA_RETRY, errors::kAttachedElsewhere}, {XAER_ASYNC, errors::kUnsupported},
    {XAER_NOTA, errors::kNoSuchTransaction}, {XAER_INVAL, errors::kBadArgument}, {XAER_PROTO, errors::kCommitProtocol},
    {XAER_RMFAIL, errors::kNotConnected}, {XAER_DUPID, errors::kDuplicateXid}, {XAER_OUTSIDE, errors::kTransactionActive},
    {XA_RBTIMEOUT, errors::kLockTimedOut}, {XA_RBROLLBACK, errors::kBranchRolledBack},
};

template <std::size_t kCount>
int Look(const Row (&rows)[kCount], int number, int otherwise) {
    const auto* row = std::ranges::find_if(
        rows, [number](const Row& candidate) { return number >= candidate.first && number <= candidate.last; });
    return row == std::end(rows) ? otherwise : row->code;
}

int NumberOf(const Answer& answer) {
    if (answer.code == XA_OK) return 0;
    if (answer.status.Number() != 0) return answer.status.Number();
    const auto* row = std::ranges::find(kNumbers, answer.code, &Meaning::code);
    return row == std::end(kNumbers) ? errors::kInternalError : row->number;
}

// Padded with blanks.
template <std::size_t kSize>
void Fill(char (&field)[kSize], std::string_view text) {
    std::memset(field, ' ', kSize);
    text.copy(field, kSize);
}

SQLCA Diagnose(const Answer& answer) {
    const int number = NumberOf(answer);
    const std::string words = answer.status.Detail();
    SQLCA area = {};
    Fill(area.sqlcaid, "SQLCA");
    area.sqlcabc = sizeof area;
    area.sqlcode = answer.code == XA_RDONLY ? number : -number;
    area.sqlerrml = static_cast<sb2>(std::min(words.size(), sizeof area.sqlerrmc));
    Fill(area.sqlerrmc, words);
    Fill(area.sqlerrp, answer.status.Engine());
    Fill(area.sqlwarn, "");
    Fill(area.sqlstate, SqlState(number));
    return area;
}

// The system's thread-specific data: for a variable of the language's without memory the process would end.
using Diagnostics = std::map<int, SQLCA>;
struct ThreadKey {
    pthread_key_t key{};
    const bool made = pthread_key_create(&key, [](void* own) { delete static_cast<Diagnostics*>(own); }) == 0;
};
const ThreadKey& KeyOfThreads() {
    static const ThreadKey key;
    return key;
}

// Null when the thread has none.
Diagnostics* OfThisThread() {
    const ThreadKey& key = KeyOfThreads();
    return key.made ? static_cast<Diagnostics*>(pthread_getspecific(key.key)) : nullptr;
}

Diagnostics& MadeForThisThread() {
    if (Diagnostics* const own = OfThisThread()) return *own;
    auto made = std::make_unique<Diagnostics>();
    if (!KeyOfThreads().made || pthread_setspecific(KeyOfThreads().key, made.get()) != 0) throw std::bad_alloc();
    return *made.release();
}

}  // namespace

int CodeOf(int number) { return Look(kCodes, number, XAER_RMERR); }

Answer AnswerOf(Status status) {
    const int code = Look(kBranchCodes, status.Number(), CodeOf(status.Number()));
    return {code, std::move(status)};
}

// Without memory for them the diagnostics are those of no call.
int Note(int rmid, const Answer& answer) noexcept try {
    MadeForThisThread()[rmid] = Diagnose(answer);
    return answer.code;
} catch (...) {
    if (Diagnostics* const own = OfThisThread()) own->erase(rmid);
    return answer.code;
}

bool Noted(int rmid, SQLCA& diagnostics) {
    const Diagnostics* const own = OfThisThread();
    if (!own) return false;
    const auto found = own->find(rmid);
    if (found == own->end()) return false;
    diagnostics = found->second;
    return true;
}

}  // namespace xa
