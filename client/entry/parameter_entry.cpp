// OCIParamGet: the columns of a statement, what was described, and the failed rows of an array execute.
#include "describe/describe_handle.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "statements/statement.h"

namespace {

// The failure at `index`, from 0, as an error handle: the one that *out points to, or a new one.
Status GetRowFailure(ErrorHandle& error, ub4 index, dvoid** out) {
    if (index >= error.row_failures.size()) return Error(errors::kNoParameter);
    if (!out) return Error(errors::kNullArgument);
    auto* target = Live<ErrorHandle>(*out);
    if (!target || target == &error) target = Create<ErrorHandle>(error, OCI_HTYPE_ERROR, 0);
    const ErrorHandle::RowFailure& failure = error.row_failures[index];
    target->list.Clear();
    target->list.Add(failure.status);
    target->row_offset = failure.row;
    *out = target;
    return {};
}

}  // namespace

sword OCIParamGet(const dvoid* hndl, ub4 type, OCIError* err, dvoid** paramOut, ub4 pos) {
    switch (type) {
        case OCI_HTYPE_STMT:
            return Enter<Statement>(hndl, err,
                                    [&](Statement& statement) { return statement.GetParameter(pos, paramOut); });
        case OCI_HTYPE_ERROR:
            return Enter<ErrorHandle>(hndl, err,
                                      [&](ErrorHandle& error) { return GetRowFailure(error, pos, paramOut); });
        case OCI_HTYPE_DESCRIBE:
            return Enter<DescribeHandle>(
                hndl, err, [&](DescribeHandle& describe) { return describe.GetParameter(pos, paramOut); });
        case OCI_DTYPE_PARAM:
            return Enter<Parameter>(hndl, err,
                                    [&](Parameter& parameter) { return parameter.GetMember(pos, paramOut); });
        default:
            return Enter<Object>(hndl, err, [&](Object&) { return Error(errors::kIllegalHandleType); });
    }
}
