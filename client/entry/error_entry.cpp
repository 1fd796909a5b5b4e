// Reading error records: OCIErrorGet. It leaves the records as they are, and leaves none of its own. Threads that share
// a handle see each other's records.
#include <cstring>
#include <optional>

#include "handles/gate.h"
#include "oci.h"
#include "platform/utf.h"

namespace {

// Five characters, no terminator: callers' areas have room for no more.
void StoreState(const Environment& environment, int number, OraText* target) {
    std::string converted;
    const std::string_view state = TextOut(environment, SqlState(number), converted);
    std::memcpy(target, state.data(), state.size());
}

// Callers read texts of up to OCI_ERROR_MAXMSG_SIZE bytes: an engine's long message is cut, but still ends its line.
std::string Message(const Environment& environment, const ErrorList::Record& record) {
    const std::size_t longest = OCI_ERROR_MAXMSG_SIZE / (environment.Utf16() ? 2 : 1) - 1;
    std::string message = ErrorMessage(record.number, record.engine, record.detail);
    if (message.size() <= longest) return message;
    message.resize(utf::WholeUtf8(message, longest - 1));
    return message += '\n';
}

sword GetRecord(const Environment& environment, const ErrorList& list, ub4 recordno, OraText* sqlstate, sb4* code,
                OraText* buf, ub4 bufsize) noexcept try {
    const std::optional<ErrorList::Record> record = list.At(recordno);
    if (!record) return OCI_NO_DATA;
    if (code) *code = record->number;
    if (sqlstate) StoreState(environment, record->number, sqlstate);
    if (!buf) return OCI_SUCCESS;
    return TextToBuffer(environment, Message(environment, *record), buf, bufsize) ? OCI_SUCCESS : OCI_ERROR;
} catch (const std::bad_alloc&) {
    return OCI_ERROR;
}

}  // namespace

sword OCIErrorGet(dvoid* hndl, ub4 recordno, OraText* sqlstate, sb4* code, OraText* buf, ub4 bufsize, ub4 type) {
    const CallInFlight call;
    if (type == OCI_HTYPE_ERROR) {
        const ErrorHandle* error = Live<ErrorHandle>(hndl);
        if (!error) return OCI_INVALID_HANDLE;
        return GetRecord(error->Env(), error->list, recordno, sqlstate, code, buf, bufsize);
    }
    Environment* environment = type == OCI_HTYPE_ENV ? Live<Environment>(hndl) : nullptr;
    if (!environment) return OCI_INVALID_HANDLE;
    return GetRecord(*environment, environment->errors, recordno, sqlstate, code, buf, bufsize);
}
