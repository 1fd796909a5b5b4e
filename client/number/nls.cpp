// The NLS text of a conversion: settings, each a name, an equals sign and a value.
#include "platform/letters.h"
#include "handles/errors.h"
#include "number/format.h"

namespace number {

namespace {

constexpr std::size_t kMostCurrency = 10;  // characters

// Territories whose currency NLS_ISO_CURRENCY can name.
constexpr struct {
    std::string_view territory;
    std::string_view currency;
} kTerritories[] = {
    {"AMERICA", "USD"},  {"AUSTRALIA", "AUD"},      {"AUSTRIA", "EUR"}, {"BELGIUM", "EUR"}, {"BRAZIL", "BRL"},
    {"CANADA", "CAD"},   {"CHINA", "CNY"},          {"DENMARK", "DKK"}, {"FINLAND", "EUR"}, {"FRANCE", "EUR"},
    {"GERMANY", "EUR"},  {"GREECE", "EUR"},         {"INDIA", "INR"},   {"IRELAND", "EUR"}, {"ITALY", "EUR"},
    {"JAPAN", "JPY"},    {"KOREA", "KRW"},          {"MEXICO", "MXN"},  {"NORWAY", "NOK"},  {"POLAND", "PLN"},
    {"PORTUGAL", "EUR"}, {"RUSSIA", "RUB"},         {"SPAIN", "EUR"},   {"SWEDEN", "SEK"},  {"SWITZERLAND", "CHF"},
    {"TURKEY", "TRY"},   {"UNITED KINGDOM", "GBP"},
};

// Takes a value in doubled or single quotes, or up to the next blank.
bool TakeValue(std::string_view* text, std::string_view* value) {
    std::string_view quotes = text->starts_with("''") ? "''" : text->starts_with('\'') ? "'" : "";
    text->remove_prefix(quotes.size());
    const std::size_t end = text->find(quotes.empty() ? " " : quotes);
    if (end == std::string_view::npos && !quotes.empty()) return false;
    *value = text->substr(0, end);
    text->remove_prefix(value->size() + quotes.size());
    return true;
}

bool SetNumericCharacters(std::string_view value, Nls* nls) {
    constexpr std::string_view kTaken = "+-<>0123456789";
    if (value.size() != 2 || value[0] == value[1] || value.find_first_of(kTaken) != std::string_view::npos)
        return false;
    if (static_cast<unsigned char>(value[0]) >= 128 || static_cast<unsigned char>(value[1]) >= 128) return false;
    nls->decimal = value[0];
    nls->group = value[1];
    return true;
}

bool SetText(std::string_view value, std::string_view* setting) {
    *setting = value;
    return letters::CharacterCount(value) <= kMostCurrency;
}

bool SetTerritory(std::string_view value, Nls* nls) {
    for (const auto& row : kTerritories) {
        if (!letters::EqualFolded(value, row.territory)) continue;
        nls->iso_currency = row.currency;
        return true;
    }
    return false;
}

bool Set(std::string_view name, std::string_view value, Nls* nls) {
    if (letters::EqualFolded(name, "NLS_NUMERIC_CHARACTERS")) return SetNumericCharacters(value, nls);
    if (letters::EqualFolded(name, "NLS_CURRENCY")) return SetText(value, &nls->currency);
    if (letters::EqualFolded(name, "NLS_DUAL_CURRENCY")) return SetText(value, &nls->dual_currency);
    if (letters::EqualFolded(name, "NLS_ISO_CURRENCY")) return SetTerritory(value, nls);
    return false;
}

}  // namespace

Errno ParseNls(std::string_view text, Nls* nls) noexcept {
    for (text = letters::WithoutLeadingBlanks(text); !text.empty(); text = letters::WithoutLeadingBlanks(text)) {
        std::size_t length = 0;
        while (length < text.size() && (text[length] == '_' || letters::IsLetter(text[length]))) ++length;
        const std::string_view name = text.substr(0, length);
        text = letters::WithoutLeadingBlanks(text.substr(length));
        if (!text.starts_with('=')) return errors::kBadNls;
        text = letters::WithoutLeadingBlanks(text.substr(1));
        std::string_view value;
        if (!TakeValue(&text, &value) || !Set(name, value, nls)) return errors::kBadNls;
    }
    return 0;
}

}  // namespace number
