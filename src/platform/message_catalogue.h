// Message catalogues in the binary form of gettext's: texts under keys. Any thread.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

class MessageCatalogue {
public:
    // A name without a '/' is looked for in the directory KELPCI_HOME, then in ../share beside the program's own. A
    // catalogue that is missing, or is none, has no texts.
    explicit MessageCatalogue(std::string_view name);

    // Empty when there is none under the key; else it lives as long as the catalogue.
    [[nodiscard]] std::string_view Find(std::string_view key) const;

private:
    [[nodiscard]] std::uint32_t Number(std::size_t place) const;
    [[nodiscard]] std::string_view Text(std::size_t entry) const;

    std::string bytes_;    // empty: no texts
};
