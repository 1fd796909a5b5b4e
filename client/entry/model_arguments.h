// What the calls take that read and write dates as text: a format model, a language, and an area for the text.
#pragma once

#include <string>

#include "date/format.h"
#include "entry/call_text.h"
#include "handles/errors.h"
#include "handles/status.h"

class ModelArguments {
public:
    // `usual` is the model that stands for none; what the application says ends at a zero.
    ModelArguments(const Environment& environment, std::string_view usual, const OraText* model,
                   std::size_t model_length, const OraText* language, std::size_t language_length)
        : usual_(usual), model_(environment, model, model_length, false),
          language_(environment, language, language_length, false) {}

    date::Errno Resolve() {
        if (!model_.Valid() || !language_.Valid()) return errors::kBadText;
        if (!language_.View().empty()) known_ = date::FindLanguage(language_.View());
        return known_ ? 0 : errors::kBadLanguage;
    }

    [[nodiscard]] std::string_view Model() const { return model_.View().empty() ? usual_ : model_.View(); }
    [[nodiscard]] const date::Language& Language() const { return *known_; }

private:
    std::string_view usual_;
    CallText model_;
    CallText language_;
    const date::Language* known_ = &date::kEnglish;
};

// Writes a text into the application's area of *size bytes, in its form and without a terminator; the size is set to
// the text's, or to what would be needed (22059).
inline Status WriteText(const Environment& environment, std::string_view text, ub4* size, OraText* out) {
    std::string converted;
    const std::string_view shown = TextOut(environment, text, converted);
    const ub4 room = *size;
    *size = static_cast<ub4>(shown.size());
    if (shown.size() > room) {
        return Error(errors::kBufferTooSmall, std::to_string(shown.size()) + " bytes are needed");
    }
    shown.copy(reinterpret_cast<char*>(out), shown.size());
    return {};
}

// A date as text; fraction_digits as in date::ToText.
inline Status DateText(const date::DateTime& value, const ModelArguments& arguments, date::Scope scope,
                       std::string& text, int fraction_digits = -1) {
    text.assign(256, '\0');
    std::size_t length = 0;
    auto write = [&] {
        return date::ToText(value, arguments.Model(), arguments.Language(), scope, text.data(), text.size(), &length,
                            fraction_digits);
    };
    int number = write();
    if (number == errors::kBufferTooSmall) {
        text.resize(length);
        number = write();
    }
    text.resize(length);
    return number ? Error(number) : Status();
}
