// Texts into the library's numbers, in UTF-16 where the environment wants it.
#include "objects/library_number.h"

#include <string>

#include "core/state.h"
#include "objects/text_conversion.h"
#include "platform/client_library.h"

namespace {

std::string ForEnvironment(std::string_view text) {
    if (!Utf16Mode) return std::string(text);
    std::string converted(4 * text.size() + 1, '\0');
    uint32_t length = 0;
    convertToUTF16(text.data(), static_cast<uint32_t>(text.size()), converted.data(),
                   static_cast<uint32_t>(converted.size()), &length, true);
    converted.resize(length);
    return converted;
}

const OraText* Text(const std::string& text) {
    return reinterpret_cast<const OraText*>(text.c_str());
}

}  // namespace

sword NumberFromText(std::string_view text, OCINumber& number) {
    const std::string digits = ForEnvironment(text);
    const std::string format = ForEnvironment(std::string(text.size(), '9'));
    return Call(&ClientLibrary::OCINumberFromText, DefaultErrorHandle, Text(digits), static_cast<ub4>(digits.size()),
                Text(format), static_cast<ub4>(format.size()), Text(""), ub4{0}, &number);
}
