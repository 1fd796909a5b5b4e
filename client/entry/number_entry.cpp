// The number package: 45 functions on OCINumber. They need no handle but the error handle, which also says in what form
// texts come and go.
#include <string>

#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/gate.h"
#include "number/format.h"
#include "number/number.h"

namespace {

using number::Errno;

constexpr ub4 kLargestBuffer = 0x7FFFFFFF;  // above, a size was negative

// The record of a refused operation. Of malformed operands it names the first.
Status Refused(Errno error, std::initializer_list<const OCINumber*> operands) {
    if (error != errors::kBadNumber) return error ? Error(error) : Status();
    int position = 1;
    for (const OCINumber* operand : operands) {
        if (!number::IsValid(*operand)) return Error(error, "number " + std::to_string(position));
        ++position;
    }
    return Error(error, "outside the domain of the function");
}

// What all functions of numbers do: refuse null pointers, compute(), record.
template <class Result, class Compute>
sword Run(OCIError* err, std::initializer_list<const OCINumber*> operands, Result* result, Compute compute) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        for (const OCINumber* operand : operands) {
            if (!operand) return Error(errors::kNullArgument);
        }
        if (!result) return Error(errors::kNullArgument);
        const Errno error = compute();
        return error ? Refused(error, operands) : Status();
    });
}

sword Apply(OCIError* err, const OCINumber* value, OCINumber* result, number::Unary function) {
    return Run(err, {value}, result, [&] { return function(*value, result); });
}

sword Apply(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result, number::Binary function) {
    return Run(err, {left, right}, result, [&] { return function(*left, *right, result); });
}

sword Apply(OCIError* err, const OCINumber* value, sword amount, OCINumber* result, number::Scaled function) {
    return Run(err, {value}, result, [&] { return function(*value, amount, result); });
}

sword Test(OCIError* err, const OCINumber* value, sword* result, number::Tested function) {
    return Run(err, {value}, result, [&] { return function(*value, result); });
}

// An unusual length comes with a null pointer from callers that have no integer of that width: the length is told
// first.
Errno CheckInteger(uword length, uword sign, const void* integer, const OCINumber* value) {
    if (!number::IsIntegerLength(length)) return errors::kBadIntegerLength;
    if (sign != OCI_NUMBER_UNSIGNED && sign != OCI_NUMBER_SIGNED) return errors::kBadSignFlag;
    return integer && value ? 0 : errors::kNullArgument;
}

template <class Real, Errno (*kConvert)(const OCINumber&, Real*) noexcept>
Errno StoreReal(const OCINumber& value, void* out) {
    Real real;
    if (const Errno error = kConvert(value, &real)) return error;
    std::memcpy(out, &real, sizeof real);
    return 0;
}

template <class Real, Errno (*kConvert)(Real, OCINumber*) noexcept> Errno LoadReal(const void* in, OCINumber* result) {
    Real real;
    std::memcpy(&real, in, sizeof real);
    return kConvert(real, result);
}

struct RealWidth {
    uword length;
    Errno (*store)(const OCINumber&, void*);
    Errno (*load)(const void*, OCINumber*);
};
constexpr RealWidth kRealWidths[] = {
    {sizeof(float), StoreReal<float, number::ToFloat>, LoadReal<float, number::FromFloat>},
    {sizeof(double), StoreReal<double, number::ToDouble>, LoadReal<double, number::FromDouble>},
    {sizeof(long double), StoreReal<long double, number::ToLongDouble>, LoadReal<long double, number::FromLongDouble>},
};

const RealWidth* FindRealWidth(uword length) {
    for (const RealWidth& width : kRealWidths) {
        if (width.length == length) return &width;
    }
    return nullptr;
}

// The model and the NLS text of a conversion.
class FormatArguments {
public:
    FormatArguments(const Environment& environment, const OraText* model, ub4 model_length, const OraText* nls,
                    ub4 nls_length)
        : model_(environment, model, model_length, false), nls_text_(environment, nls, nls_length, false) {}

    Errno Resolve() {
        if (!model_.Valid() || !nls_text_.Valid()) return errors::kBadText;
        return number::ParseNls(nls_text_.View(), &nls_);
    }
    [[nodiscard]] std::string_view Model() const { return model_.View(); }
    [[nodiscard]] const number::Nls& Nls() const { return nls_; }

private:
    CallText model_;
    CallText nls_text_;
    number::Nls nls_;
};

Status TooSmall(std::size_t needed) {
    return Error(errors::kBufferTooSmall, std::to_string(needed) + " bytes are needed");
}

// Writes straight into the application's area.
Status WriteText(const OCINumber& value, const FormatArguments& arguments, ub4* size, OraText* out) {
    std::size_t length = 0;
    const Errno error =
        number::ToText(value, arguments.Model(), arguments.Nls(), reinterpret_cast<char*>(out), *size, &length);
    if (error == errors::kBufferTooSmall) return TooSmall(length);
    if (error) return Refused(error, {&value});
    *size = static_cast<ub4>(length);
    return {};
}

// The same in a set other than UTF-8, by way of a text of our own.
Status WriteConverted(const Environment& environment, const OCINumber& value, const FormatArguments& arguments, ub4* size,
                      OraText* out) {
    std::string text(256, '\0');
    std::size_t length = 0;
    auto write = [&] {
        return number::ToText(value, arguments.Model(), arguments.Nls(), text.data(), text.size(), &length);
    };
    Errno error = write();
    if (error == errors::kBufferTooSmall) {
        text.resize(length);
        error = write();
    }
    if (error) return Refused(error, {&value});
    std::string converted;
    const std::string_view shown = TextOut(environment, std::string_view(text).substr(0, length), converted);
    if (shown.size() > *size) return TooSmall(shown.size());
    *size = static_cast<ub4>(shown.size());
    shown.copy(reinterpret_cast<char*>(out), shown.size());
    return {};
}

}  // namespace

sword OCINumberAbs(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Abs);
}

sword OCINumberArcCos(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::ArcCos);
}

sword OCINumberArcSin(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::ArcSin);
}

sword OCINumberArcTan(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::ArcTan);
}

sword OCINumberAssign(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Assign);
}

sword OCINumberCeil(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Ceil);
}

sword OCINumberCos(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Cos);
}

sword OCINumberExp(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Exp);
}

sword OCINumberFloor(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Floor);
}

sword OCINumberHypCos(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::HypCos);
}

sword OCINumberHypSin(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::HypSin);
}

sword OCINumberHypTan(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::HypTan);
}

sword OCINumberLn(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Ln);
}

sword OCINumberNeg(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Neg);
}

sword OCINumberSin(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Sin);
}

sword OCINumberSqrt(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Sqrt);
}

sword OCINumberTan(OCIError* err, const OCINumber* value, OCINumber* result) {
    return Apply(err, value, result, number::Tan);
}

sword OCINumberAdd(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result) {
    return Apply(err, left, right, result, number::Add);
}

sword OCINumberArcTan2(OCIError* err, const OCINumber* y, const OCINumber* x, OCINumber* result) {
    return Apply(err, y, x, result, number::ArcTan2);
}

sword OCINumberDiv(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result) {
    return Apply(err, left, right, result, number::Div);
}

sword OCINumberLog(OCIError* err, const OCINumber* base, const OCINumber* value, OCINumber* result) {
    return Apply(err, base, value, result, number::Log);
}

sword OCINumberMod(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result) {
    return Apply(err, left, right, result, number::Mod);
}

sword OCINumberMul(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result) {
    return Apply(err, left, right, result, number::Mul);
}

sword OCINumberPower(OCIError* err, const OCINumber* base, const OCINumber* exponent, OCINumber* result) {
    return Apply(err, base, exponent, result, number::Power);
}

sword OCINumberSub(OCIError* err, const OCINumber* left, const OCINumber* right, OCINumber* result) {
    return Apply(err, left, right, result, number::Sub);
}

sword OCINumberIntPower(OCIError* err, const OCINumber* base, sword exponent, OCINumber* result) {
    return Apply(err, base, exponent, result, number::IntPower);
}

sword OCINumberPrec(OCIError* err, const OCINumber* value, eword digits, OCINumber* result) {
    return Apply(err, value, digits, result, number::Prec);
}

sword OCINumberRound(OCIError* err, const OCINumber* value, sword places, OCINumber* result) {
    return Apply(err, value, places, result, number::Round);
}

sword OCINumberShift(OCIError* err, const OCINumber* value, sword digits, OCINumber* result) {
    return Apply(err, value, digits, result, number::Shift);
}

sword OCINumberTrunc(OCIError* err, const OCINumber* value, sword places, OCINumber* result) {
    return Apply(err, value, places, result, number::Trunc);
}

sword OCINumberInc(OCIError* err, OCINumber* value) { return Apply(err, value, value, number::Inc); }

sword OCINumberDec(OCIError* err, OCINumber* value) { return Apply(err, value, value, number::Dec); }

sword OCINumberCmp(OCIError* err, const OCINumber* left, const OCINumber* right, sword* result) {
    return Run(err, {left, right}, result, [&] { return number::Compare(*left, *right, result); });
}

sword OCINumberSign(OCIError* err, const OCINumber* value, sword* result) {
    return Test(err, value, result, number::Sign);
}

sword OCINumberIsInt(OCIError* err, const OCINumber* value, boolean* result) {
    return Test(err, value, result, number::IsInt);
}

sword OCINumberIsZero(OCIError* err, const OCINumber* value, boolean* result) {
    return Test(err, value, result, number::IsZero);
}

void OCINumberSetZero(OCIError*, OCINumber* result) {
    if (result) number::SetZero(result);
}

void OCINumberSetPi(OCIError*, OCINumber* result) {
    if (result) number::SetPi(result);
}

sword OCINumberFromInt(OCIError* err, const dvoid* value, uword length, uword sign, OCINumber* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (const Errno error = CheckInteger(length, sign, value, out)) return Error(error);
        number::FromInteger(value, length, sign == OCI_NUMBER_SIGNED, out);
        return {};
    });
}

sword OCINumberToInt(OCIError* err, const OCINumber* value, uword length, uword sign, dvoid* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        if (const Errno error = CheckInteger(length, sign, out, value)) return Error(error);
        return Refused(number::ToInteger(*value, length, sign == OCI_NUMBER_SIGNED, out), {value});
    });
}

sword OCINumberFromReal(OCIError* err, const dvoid* value, uword length, OCINumber* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        const RealWidth* width = FindRealWidth(length);
        if (!width || !value || !out) return Error(errors::kNullArgument);
        const Errno error = width->load(value, out);
        return error ? Error(error) : Status();
    });
}

sword OCINumberToReal(OCIError* err, const OCINumber* value, uword length, dvoid* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        const RealWidth* width = FindRealWidth(length);
        if (!width || !value || !out) return Error(errors::kNullArgument);
        return Refused(width->store(*value, out), {value});
    });
}

// The elements before the first that fails are converted.
sword OCINumberToRealArray(OCIError* err, const OCINumber** values, uword elems, uword length, dvoid* out) {
    return EnterError(err, [&](ErrorHandle&) -> Status {
        const RealWidth* width = FindRealWidth(length);
        if (!width || !values || !out) return Error(errors::kNullArgument);
        auto* real = static_cast<char*>(out);
        for (uword index = 0; index < elems; ++index, real += length) {
            if (!values[index]) return Error(errors::kNullArgument);
            Status status = Refused(width->store(*values[index], real), {values[index]});
            if (!status.Ok()) return status;
        }
        return {};
    });
}

sword OCINumberFromText(OCIError* err, const OraText* str, ub4 strLen, const OraText* fmt, ub4 fmtLen,
                        const OraText* nls, ub4 nlsLen, OCINumber* out) {
    return EnterError(err, [&](ErrorHandle& error) -> Status {
        if (!str || !out) return Error(errors::kNullArgument);
        const CallText text(error.Env(), str, strLen, false);
        if (!text.Valid()) return Error(errors::kBadText);
        FormatArguments arguments(error.Env(), fmt, fmtLen, nls, nlsLen);
        if (const Errno problem = arguments.Resolve()) return Error(problem);
        const Errno problem = number::FromText(text.View(), arguments.Model(), arguments.Nls(), out);
        return problem ? Error(problem) : Status();
    });
}

sword OCINumberToText(OCIError* err, const OCINumber* value, const OraText* fmt, ub4 fmtLen, const OraText* nls,
                      ub4 nlsLen, ub4* bufsize, OraText* buf) {
    return EnterError(err, [&](ErrorHandle& error) -> Status {
        if (!value || !bufsize || !buf || *bufsize > kLargestBuffer) return Error(errors::kNullArgument);
        const Environment& environment = error.Env();
        FormatArguments arguments(environment, fmt, fmtLen, nls, nlsLen);
        if (const Errno problem = arguments.Resolve()) return Error(problem);
        return environment.Converts() ? WriteConverted(environment, *value, arguments, bufsize, buf)
                                      : WriteText(*value, arguments, bufsize, buf);
    });
}
