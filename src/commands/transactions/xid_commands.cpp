// Naming the identifiers of global transactions. Command thread only.
#include <algorithm>
#include <cstring>

#include "commands/families.h"
#include "core/keywords.h"
#include "core/messages.h"
#include "objects/xids.h"

namespace {

// Three words give a byte each, the last one all its characters with the closing zero; what is beyond the data is cut.
void FillData(char* data, char** words, const char* rest) {
    constexpr size_t kSingleBytes = 3;
    for (size_t index = 0; index < kSingleBytes; ++index) data[index] = words[index][0];
    std::memcpy(data + kSingleBytes, rest, std::min(std::strlen(rest) + 1, XIDDATASIZE - kSingleBytes));
}

void InitXid(const CommandRow&, int, char** words) {
    const char* const name = words[1];
    if (FindXid(name) != nullptr) return Message(kError, "Name already in use %s\n", name);
    if (IsNull(name) || IsInvalid(name)) return Message(kError, "Variable name NULL not allowed\n");
    NamedXid* const slot = TakeXidSlot(name);
    if (slot == nullptr) return Message(kError, "Reached max xid count - %ld\n", static_cast<long>(kMostXids));
    slot->xid.formatID = DecodeNumber(words[2]);
    slot->xid.gtrid_length = DecodeNumber(words[3]);
    slot->xid.bqual_length = DecodeNumber(words[7]);
    FillData(slot->xid.data, words + 4, words[8]);
}

constexpr PlainCommand kXidCommands[] = {
    {{Code::initxid, Words(9), "InitXID name formatID gtrid_length data0 data1 data2 bqual_length data3"}, InitXid},
};

}  // namespace

void AddXidCommands(HandlerTable& handlers) {
    handlers.Add(kXidCommands);
}
