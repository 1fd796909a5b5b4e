// Numbers: the library's, the machine's, packed decimals, decimal floats. Command thread only.
#include <algorithm>
#include <string>

#include "core/state.h"
#include "objects/decimal_float_query.h"
#include "objects/displays.h"
#include "objects/element_access.h"
#include "platform/client_library.h"
#include "platform/packed_decimal.h"

namespace {

// Room for the digits, the zeros that the scale adds before or behind them, sign, leading zero, point and closing zero.
size_t RoomForDecimal(uint32_t precision, int scale) {
    constexpr int kRest = 4;
    const int digits = 2 * static_cast<int>(PackedDecimalSize(precision)) - 1;
    return static_cast<size_t>(kRest + (scale < 0 ? digits - scale : std::max(digits, scale)));
}

}  // namespace

sword ShowNumber(Line& line, const ElementView& element) {
    const auto number = ReadElement<OCINumber>(element.data, element.size);
    double value = 0;
    const sword rc = Call(&ClientLibrary::OCINumberToReal, DefaultErrorHandle, &number, uword{sizeof value}, &value);
    if (rc != OCI_SUCCESS) return rc;
    line.Format("%f", value);
    return EndLine(line);
}

sword ShowSigned(Line& line, const ElementView& element) {
    line.Format("%lld", static_cast<long long>(ReadSigned(element.data, element.size)));
    return EndLine(line);
}

sword ShowUnsigned(Line& line, const ElementView& element) {
    line.Format("%llu", static_cast<unsigned long long>(ReadUnsigned(element.data, element.size)));
    return EndLine(line);
}

sword ShowReal(Line& line, const ElementView& element) {
    double value = 0;
    if (element.size == 4) value = ReadElement<float>(element.data, element.size);
    if (element.size == 8 || element.size == 16) value = ReadElement<double>(element.data, element.size);
    line.Format("%f", value);
    return EndLine(line);
}

sword ShowPackedDecimal(Line& line, const ElementView& element) {
    std::string text(RoomForDecimal(element.precision, element.scale), '\0');
    // The type may have been changed, and the precision speak of more bytes than there are.
    const bool whole = PackedDecimalSize(element.precision) <= element.size;
    const int rc = !whole ? kDecimalBadSign
                          : DecimalToText(element.data, element.precision, element.scale, text.data(), text.size());
    if (rc != kDecimalDone) {
        line.Print();
        Message(kError, "DecimalToText failed with rc - %ld\n", static_cast<long>(rc));
    }
    line.Text(text.c_str());
    return EndLine(line);
}

sword ShowDecimalFloat(Line& line, const ElementView& element) {
    line.Print();  // the statement that converts may run callbacks which print
    std::string text;
    const sword rc = DecimalFloatText(element.type, element.data, element.size, text);
    if (rc != OCI_SUCCESS) return rc;
    line.Text(text);
    return EndLine(line);
}
