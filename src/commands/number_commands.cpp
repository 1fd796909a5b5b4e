// The commands on numbers that share a handler: a row each. Those that convert have handlers of their own, in
// number_conversions.cpp.
#include "commands/number_conversions.h"
#include "commands/number_values.h"

namespace {

using OneNumber = ValueOperation<OCINumber, const OCINumber*>;
constexpr OneNumber kOneNumber[] = {
    {{220, WordsBetween(3, 4), "OCINumberAbs hError number [result]"}, &ClientLibrary::OCINumberAbs},
    {{222, WordsBetween(3, 4), "OCINumberArcCos hError number [result]"}, &ClientLibrary::OCINumberArcCos},
    {{223, WordsBetween(3, 4), "OCINumberArcSin hError number [result]"}, &ClientLibrary::OCINumberArcSin},
    {{224, WordsBetween(3, 4), "OCINumberArcTan hError number [result]"}, &ClientLibrary::OCINumberArcTan},
    {{226, WordsBetween(3, 4), "OCINumberAssign hError number [result]"}, &ClientLibrary::OCINumberAssign},
    {{227, WordsBetween(3, 4), "OCINumberCeil hError number [result]"}, &ClientLibrary::OCINumberCeil},
    {{229, WordsBetween(3, 4), "OCINumberCos hError number [result]"}, &ClientLibrary::OCINumberCos},
    {{232, WordsBetween(3, 4), "OCINumberExp hError number [result]"}, &ClientLibrary::OCINumberExp},
    {{233, WordsBetween(3, 4), "OCINumberFloor hError number [result]"}, &ClientLibrary::OCINumberFloor},
    {{237, WordsBetween(3, 4), "OCINumberHypCos hError number [result]"}, &ClientLibrary::OCINumberHypCos},
    {{238, WordsBetween(3, 4), "OCINumberHypSin hError number [result]"}, &ClientLibrary::OCINumberHypSin},
    {{239, WordsBetween(3, 4), "OCINumberHypTan hError number [result]"}, &ClientLibrary::OCINumberHypTan},
    {{244, WordsBetween(3, 4), "OCINumberLn hError number [result]"}, &ClientLibrary::OCINumberLn},
    {{248, WordsBetween(3, 4), "OCINumberNeg hError number [result]"}, &ClientLibrary::OCINumberNeg},
    {{256, WordsBetween(3, 4), "OCINumberSin hError number [result]"}, &ClientLibrary::OCINumberSin},
    {{257, WordsBetween(3, 4), "OCINumberSqrt hError number [result]"}, &ClientLibrary::OCINumberSqrt},
    {{259, WordsBetween(3, 4), "OCINumberTan hError number [result]"}, &ClientLibrary::OCINumberTan},
};

using TwoNumbers = ValueOperation<OCINumber, const OCINumber*, const OCINumber*>;
constexpr TwoNumbers kTwoNumbers[] = {
    {{221, WordsBetween(4, 5), "OCINumberAdd hError number1 number2 [result]"}, &ClientLibrary::OCINumberAdd},
    {{225, WordsBetween(4, 5), "OCINumberArcTan2 hError number1 number2 [result]"}, &ClientLibrary::OCINumberArcTan2},
    {{231, WordsBetween(4, 5), "OCINumberDiv hError number1 number2 [result]"}, &ClientLibrary::OCINumberDiv},
    {{245, WordsBetween(4, 5), "OCINumberLog hError base number [result]"}, &ClientLibrary::OCINumberLog},
    {{246, WordsBetween(4, 5), "OCINumberMod hError number1 number2 [result]"}, &ClientLibrary::OCINumberMod,
     Outcome::printed},
    {{247, WordsBetween(4, 5), "OCINumberMul hError number1 number2 [result]"}, &ClientLibrary::OCINumberMul},
    {{249, WordsBetween(4, 5), "OCINumberPower hError base number [result]"}, &ClientLibrary::OCINumberPower},
    {{258, WordsBetween(4, 5), "OCINumberSub hError num1 num2 [result]"}, &ClientLibrary::OCINumberSub},
};

using NumberAndInt = ValueOperation<OCINumber, const OCINumber*, int>;
constexpr NumberAndInt kNumberAndInt[] = {
    {{241, WordsBetween(4, 5), "OCINumberIntPower hError base exp [result]"}, &ClientLibrary::OCINumberIntPower},
    {{250, WordsBetween(4, 5), "OCINumberPrec hError number ndigs [result]"}, &ClientLibrary::OCINumberPrec},
    {{251, WordsBetween(4, 5), "OCINumberRound hError number decplace [result]"}, &ClientLibrary::OCINumberRound},
    {{254, WordsBetween(4, 5), "OCINumberShift hError number ndigs [result]"}, &ClientLibrary::OCINumberShift},
    {{264, WordsBetween(4, 5), "OCINumberTrunc hError number decplace [result]"}, &ClientLibrary::OCINumberTrunc},
};

// An integer or truth value is the result: printed, never stored.
using NumberTest = ValueOperation<int, const OCINumber*>;
constexpr NumberTest kNumberTests[] = {
    {{242, WordsBetween(3, 4), "OCINumberIsInt hError number [result]"}, &ClientLibrary::OCINumberIsInt},
    {{243, WordsBetween(3, 4), "OCINumberIsZero hError number [result]"}, &ClientLibrary::OCINumberIsZero},
    {{255, WordsBetween(3, 4), "OCINumberSign hError number [result]"}, &ClientLibrary::OCINumberSign},
};
using NumberComparison = ValueOperation<int, const OCINumber*, const OCINumber*>;
constexpr NumberComparison kNumberComparisons[] = {
    {{228, WordsBetween(4, 5), "OCINumberCmp hError number1 number2 [result]"}, &ClientLibrary::OCINumberCmp},
};

// The function changes its operand: a copy of what the word says, which is printed; a named buffer stays as it is.
struct NumberStep : CommandRow {
    LibraryFunction<sword(OCIError*, OCINumber*)> ClientLibrary::*function;
};
constexpr NumberStep kNumberSteps[] = {
    {{230, Words(3), "OCINumberDec hError number"}, &ClientLibrary::OCINumberDec},
    {{240, Words(3), "OCINumberInc hError number"}, &ClientLibrary::OCINumberInc},
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
    {{252, WordsBetween(2, 4), "OCINumberSetPi hError [result buffer]"}, &ClientLibrary::OCINumberSetPi},
    {{253, WordsBetween(2, 4), "OCINumberSetZero hError [result buffer]"}, &ClientLibrary::OCINumberSetZero},
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
