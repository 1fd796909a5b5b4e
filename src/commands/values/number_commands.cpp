// The commands on numbers that share a handler: a row each. Those that convert have handlers of their own, in
// number_conversions.cpp. Command thread only.
#include "commands/values/number_conversions.h"
#include "commands/values/number_values.h"

namespace {

using OneNumber = ValueOperation<OCINumber, const OCINumber*>;
constexpr OneNumber kOneNumber[] = {
    {{Code::ocinumberabs, WordsBetween(3, 4), "OCINumberAbs hError number [result]"},
     &ClientLibrary::OCINumberAbs},
    {{Code::ocinumberarccos, WordsBetween(3, 4), "OCINumberArcCos hError number [result]"},
     &ClientLibrary::OCINumberArcCos},
    {{Code::ocinumberarcsin, WordsBetween(3, 4), "OCINumberArcSin hError number [result]"},
     &ClientLibrary::OCINumberArcSin},
    {{Code::ocinumberarctan, WordsBetween(3, 4), "OCINumberArcTan hError number [result]"},
     &ClientLibrary::OCINumberArcTan},
    {{Code::ocinumberassign, WordsBetween(3, 4), "OCINumberAssign hError number [result]"},
     &ClientLibrary::OCINumberAssign},
    {{Code::ocinumberceil, WordsBetween(3, 4), "OCINumberCeil hError number [result]"},
     &ClientLibrary::OCINumberCeil},
    {{Code::ocinumbercos, WordsBetween(3, 4), "OCINumberCos hError number [result]"},
     &ClientLibrary::OCINumberCos},
    {{Code::ocinumberexp, WordsBetween(3, 4), "OCINumberExp hError number [result]"},
     &ClientLibrary::OCINumberExp},
    {{Code::ocinumberfloor, WordsBetween(3, 4), "OCINumberFloor hError number [result]"},
     &ClientLibrary::OCINumberFloor},
    {{Code::ocinumberhypcos, WordsBetween(3, 4), "OCINumberHypCos hError number [result]"},
     &ClientLibrary::OCINumberHypCos},
    {{Code::ocinumberhypsin, WordsBetween(3, 4), "OCINumberHypSin hError number [result]"},
     &ClientLibrary::OCINumberHypSin},
    {{Code::ocinumberhyptan, WordsBetween(3, 4), "OCINumberHypTan hError number [result]"},
     &ClientLibrary::OCINumberHypTan},
    {{Code::ocinumberln, WordsBetween(3, 4), "OCINumberLn hError number [result]"},
     &ClientLibrary::OCINumberLn},
    {{Code::ocinumberneg, WordsBetween(3, 4), "OCINumberNeg hError number [result]"},
     &ClientLibrary::OCINumberNeg},
    {{Code::ocinumbersin, WordsBetween(3, 4), "OCINumberSin hError number [result]"},
     &ClientLibrary::OCINumberSin},
    {{Code::ocinumbersqrt, WordsBetween(3, 4), "OCINumberSqrt hError number [result]"},
     &ClientLibrary::OCINumberSqrt},
    {{Code::ocinumbertan, WordsBetween(3, 4), "OCINumberTan hError number [result]"},
     &ClientLibrary::OCINumberTan},
};

using TwoNumbers = ValueOperation<OCINumber, const OCINumber*, const OCINumber*>;
constexpr TwoNumbers kTwoNumbers[] = {
    {{Code::ocinumberadd, WordsBetween(4, 5), "OCINumberAdd hError number1 number2 [result]"},
     &ClientLibrary::OCINumberAdd},
    {{Code::ocinumberarctan2, WordsBetween(4, 5), "OCINumberArcTan2 hError number1 number2 [result]"},
     &ClientLibrary::OCINumberArcTan2},
    {{Code::ocinumberdiv, WordsBetween(4, 5), "OCINumberDiv hError number1 number2 [result]"},
     &ClientLibrary::OCINumberDiv},
    {{Code::ocinumberlog, WordsBetween(4, 5), "OCINumberLog hError base number [result]"},
     &ClientLibrary::OCINumberLog},
    {{Code::ocinumbermod, WordsBetween(4, 5), "OCINumberMod hError number1 number2 [result]"},
     &ClientLibrary::OCINumberMod, Outcome::printed},
    {{Code::ocinumbermul, WordsBetween(4, 5), "OCINumberMul hError number1 number2 [result]"},
     &ClientLibrary::OCINumberMul},
    {{Code::ocinumberpower, WordsBetween(4, 5), "OCINumberPower hError base number [result]"},
     &ClientLibrary::OCINumberPower},
    {{Code::ocinumbersub, WordsBetween(4, 5), "OCINumberSub hError num1 num2 [result]"},
     &ClientLibrary::OCINumberSub},
};

using NumberAndInt = ValueOperation<OCINumber, const OCINumber*, int>;
constexpr NumberAndInt kNumberAndInt[] = {
    {{Code::ocinumberintpower, WordsBetween(4, 5), "OCINumberIntPower hError base exp [result]"},
     &ClientLibrary::OCINumberIntPower},
    {{Code::ocinumberprec, WordsBetween(4, 5), "OCINumberPrec hError number ndigs [result]"},
     &ClientLibrary::OCINumberPrec},
    {{Code::ocinumberround, WordsBetween(4, 5), "OCINumberRound hError number decplace [result]"},
     &ClientLibrary::OCINumberRound},
    {{Code::ocinumbershift, WordsBetween(4, 5), "OCINumberShift hError number ndigs [result]"},
     &ClientLibrary::OCINumberShift},
    {{Code::ocinumbertrunc, WordsBetween(4, 5), "OCINumberTrunc hError number decplace [result]"},
     &ClientLibrary::OCINumberTrunc},
};

// An integer or truth value is the result: printed, never stored.
using NumberTest = ValueOperation<int, const OCINumber*>;
constexpr NumberTest kNumberTests[] = {
    {{Code::ocinumberisint, WordsBetween(3, 4), "OCINumberIsInt hError number [result]"},
     &ClientLibrary::OCINumberIsInt},
    {{Code::ocinumberiszero, WordsBetween(3, 4), "OCINumberIsZero hError number [result]"},
     &ClientLibrary::OCINumberIsZero},
    {{Code::ocinumbersign, WordsBetween(3, 4), "OCINumberSign hError number [result]"},
     &ClientLibrary::OCINumberSign},
};
using NumberComparison = ValueOperation<int, const OCINumber*, const OCINumber*>;
constexpr NumberComparison kNumberComparisons[] = {
    {{Code::ocinumbercmp, WordsBetween(4, 5), "OCINumberCmp hError number1 number2 [result]"},
     &ClientLibrary::OCINumberCmp},
};

// The function changes its operand: a copy of what the word says, which is printed; a named buffer stays as it is.
struct NumberStep : CommandRow {
    LibraryFunction<sword(OCIError*, OCINumber*)> ClientLibrary::*function;
};
constexpr NumberStep kNumberSteps[] = {
    {{Code::ocinumberdec, Words(3), "OCINumberDec hError number"},
     &ClientLibrary::OCINumberDec},
    {{Code::ocinumberinc, Words(3), "OCINumberInc hError number"},
     &ClientLibrary::OCINumberInc},
};
void RunNumberStep(const NumberStep& row, int, char** words) {
    ErrorWord error(words[1]);
    NumberOperand operand;
    if (!operand.Resolve(words[2], error)) return;
    const sword rc = Call(row.function, error.Get(), operand.Copy());
    TraceAndReport(row.code, "", error.Get(), rc);
    if (rc == OCI_SUCCESS && operand.Argument() != nullptr) PrintNumber(*operand.Argument(), error.Get());
}

// The function returns nothing. The third word only says whether the result pointer is null; the fourth is where the
// number is stored.
struct NumberConstant : CommandRow {
    LibraryFunction<void(OCIError*, OCINumber*)> ClientLibrary::*function;
};
constexpr NumberConstant kNumberConstants[] = {
    {{Code::ocinumbersetpi, WordsBetween(2, 4), "OCINumberSetPi hError [result buffer]"},
     &ClientLibrary::OCINumberSetPi},
    {{Code::ocinumbersetzero, WordsBetween(2, 4), "OCINumberSetZero hError [result buffer]"},
     &ClientLibrary::OCINumberSetZero},
};
void RunNumberConstant(const NumberConstant& row, int count, char** words) {
    OCIError* const error = ResolveError<OCIError>(words[1]);
    OCINumber value = kZeroNumber;
    OCINumber* const result = count > 2 && IsNull(words[2]) ? nullptr : &value;
    Call(row.function, error, result);
    TraceAndReport(row.code, "", error, OCI_SUCCESS);
    if (result == nullptr || error == nullptr || !PrintAsReal(value, error)) return;
    if (count == 4) StoreNumberResult(words[3], value);
}

}  // namespace

void AddNumberCommands(HandlerTable& handlers) {
    handlers.Add<RunValueOperation<OCINumber, const OCINumber*>>(kOneNumber);
    handlers.Add<RunValueOperation<OCINumber, const OCINumber*, const OCINumber*>>(kTwoNumbers);
    handlers.Add<RunValueOperation<OCINumber, const OCINumber*, int>>(kNumberAndInt);
    handlers.Add<RunValueOperation<int, const OCINumber*>>(kNumberTests);
    handlers.Add<RunValueOperation<int, const OCINumber*, const OCINumber*>>(kNumberComparisons);
    handlers.Add<RunNumberStep>(kNumberSteps);
    handlers.Add<RunNumberConstant>(kNumberConstants);
    AddNumberConversions(handlers);
}
