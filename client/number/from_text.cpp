// Text to numbers by a model.
#include <algorithm>

#include "platform/letters.h"
#include "handles/errors.h"
#include "number/decimal.h"
#include "number/format.h"
#include "number/format_model.h"

namespace number {

namespace {

// Reads a text from the front; every step says whether it found what the model wants there.
class Reader {
public:
    Reader(std::string_view text, const FormatModel& model, const Nls& nls) : text_(text), model_(model), nls_(nls) {}

    Errno Read(OCINumber* result) {
        SkipBlanks();
        if (AtEnd()) {
            if (!model_.blank_zero || text_.empty()) return errors::kBadNumberText;
            SetZero(result);
            return 0;
        }
        SignBefore();
        if (!Whole() || !Fraction() || !digits_.Any()) return errors::kBadNumberText;
        int exponent = 0;
        if (model_.scientific) at_ = static_cast<std::size_t>(ReadExponent(Here(), End(), &exponent) - text_.data());
        if (model_.currency == FormatModel::Currency::trailing) TakeMoney();
        if (!SignAfter() || !AtEnd()) return errors::kBadNumberText;
        const int scale = model_.point == 'V' ? model_.places_after : 0;
        return digits_.Finish(exponent - scale, negative_, result);
    }

private:
    [[nodiscard]] bool AtEnd() const { return at_ == text_.size(); }
    [[nodiscard]] const char* Here() const { return text_.data() + at_; }
    [[nodiscard]] const char* End() const { return text_.data() + text_.size(); }

    bool Take(char c) {
        if (AtEnd() || text_[at_] != c) return false;
        ++at_;
        return true;
    }
    bool Take(std::string_view word) {
        if (!text_.substr(at_).starts_with(word)) return false;
        at_ += word.size();
        return true;
    }
    void SkipBlanks() {
        while (Take(' ')) {
        }
    }
    bool TakeMoney() {
        switch (model_.currency_element) {
            case 'L': return Take(nls_.currency);
            case 'C': return Take(nls_.iso_currency);
            case 'U': return Take(nls_.dual_currency);
            default: return Take('$');
        }
    }

    // A sign in front, before or behind the currency.
    void SignBefore() {
        const bool plain = model_.sign == FormatModel::Sign::before || model_.sign == FormatModel::Sign::leading_s;
        bool found = plain && TakeSign();
        if (model_.sign == FormatModel::Sign::brackets) negative_ = Take('<');
        if (model_.currency == FormatModel::Currency::leading && TakeMoney() && plain && !found) TakeSign();
    }
    bool TakeSign() {
        negative_ = Take('-');
        return negative_ || Take('+');
    }
    bool SignAfter() {
        switch (model_.sign) {
            case FormatModel::Sign::brackets: return negative_ ? Take('>') : (SkipBlanks(), true);
            case FormatModel::Sign::trailing_s: TakeSign(); return true;
            case FormatModel::Sign::trailing_minus:
                if (!Take('-'))
                    SkipBlanks();
                else
                    negative_ = true;
                return true;
            default: return true;
        }
    }

    [[nodiscard]] bool IsGroupHere(std::size_t at) const {
        return model_.groups && (text_[at] == nls_.group || text_[at] == ',') && text_[at] != PointCharacter();
    }
    [[nodiscard]] char PointCharacter() const {
        return model_.point == 'D' ? nls_.decimal : model_.point == '.' ? '.' : 0;
    }

    // Digits before the point. The text is laid against the model from the right: groups may be left out, but stand
    // where the model has them.
    bool Whole() {
        const std::size_t start = at_;
        while (!AtEnd() && (IsDigit(text_[at_]) || IsGroupHere(at_))) ++at_;
        int spare = model_.point == 'V' ? model_.places_after : 0;
        std::size_t element = model_.whole.size();
        for (std::size_t i = at_; i-- > start;) {
            if (spare > 0 && IsDigit(text_[i])) {
                --spare;
                continue;
            }
            for (; element > 0; --element) {
                const char wanted = model_.whole[element - 1];
                if (IsDigit(text_[i]) ? IsPlace(wanted) : IsGroup(wanted)) break;
                if (IsPlace(wanted)) return false;  // a group where a digit should be
            }
            if (element == 0) return false;
            --element;
        }
        for (std::size_t i = start; i < at_; ++i)
            if (IsDigit(text_[i])) digits_.Add(text_[i], false);
        return true;
    }

    bool Fraction() {
        if (model_.point == 0 || model_.point == 'V') return true;
        const bool found = model_.currency == FormatModel::Currency::point ? TakeMoney() : Take(PointCharacter());
        if (!found) return true;
        int places = 0;
        for (; !AtEnd() && IsDigit(text_[at_]); ++at_, ++places) digits_.Add(text_[at_], true);
        return places <= model_.places_after;
    }

    std::string_view text_;
    const FormatModel& model_;
    const Nls& nls_;
    std::size_t at_ = 0;
    bool negative_ = false;
    DigitReader digits_;
};

Errno ReadHexadecimal(std::string_view text, const FormatModel& model, OCINumber* result) {
    text = letters::WithoutLeadingBlanks(text);
    if (text.empty() || text.size() > static_cast<std::size_t>(model.places_before)) return errors::kBadNumberText;
    OCINumber value, sixteen, digit, product;
    SetZero(&value);
    FromInt64(16, &sixteen);
    for (const char c : text) {
        const char letter = letters::ToUpper(c);
        const bool is_letter = letter >= 'A' && letter <= 'F';
        if (!IsDigit(c) && !is_letter) return errors::kBadNumberText;
        FromInt64(is_letter ? letter - 'A' + 10 : c - '0', &digit);
        if (const Errno error = Mul(value, sixteen, &product)) return error;
        if (const Errno error = Add(product, digit, &value)) return error;
    }
    *result = value;
    return 0;
}

// Reads what it can digit by digit; the letters must then be those that the value is spelled with.
Errno ReadRoman(std::string_view text, OCINumber* result) {
    text = letters::WithoutLeadingBlanks(text);
    if (text.empty() || text.size() > kRomanWidth) return errors::kBadNumberText;
    char upper[kRomanWidth];
    std::transform(text.begin(), text.end(), upper, letters::ToUpper);
    const std::string_view capitals(upper, text.size());
    std::string_view rest = capitals;
    int value = 0;
    for (const RomanDigit& digit : kRomanDigits)
        for (; rest.starts_with(digit.letters); rest.remove_prefix(digit.letters.size())) value += digit.value;
    char letters[kRomanWidth];
    if (!rest.empty() || value > kLargestRoman || SpellRoman(value, letters) != capitals) return errors::kBadNumberText;
    FromInt64(value, result);
    return 0;
}

Errno ReadWithoutModel(std::string_view text, const Nls& nls, OCINumber* result) {
    Errno error;
    return ReadPlain(text, nls.decimal, result, &error) ? error : errors::kBadNumberText;
}

}  // namespace

Errno FromText(std::string_view text, std::string_view model, const Nls& nls, OCINumber* result) noexcept {
    const bool nines = model.size() == text.size() && model.find_first_not_of('9') == std::string_view::npos;
    if (nines || model.empty()) return ReadWithoutModel(text, nls, result);
    FormatModel parsed;
    if (const Errno error = ParseFormat(model, &parsed)) return error;
    switch (parsed.kind) {
        case FormatModel::Kind::hexadecimal: return ReadHexadecimal(text, parsed, result);
        case FormatModel::Kind::roman: return ReadRoman(text, result);
        case FormatModel::Kind::fixed: return Reader(text, parsed, nls).Read(result);
        default: return ReadWithoutModel(text, nls, result);
    }
}

}  // namespace number
