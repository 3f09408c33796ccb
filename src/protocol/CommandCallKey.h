// CommandCallKey: which command, which version, which call (guid and channel).
#ifndef TARN_SRC_PROTOCOL_COMMANDCALLKEY_H_
#define TARN_SRC_PROTOCOL_COMMANDCALLKEY_H_

#include "Tarn/CommandGuid.h"
#include "ZelUnicodeString.h"

namespace Tarn {

struct CommandCallKey {
    ZelUnicodeString name;
    int version = 0;
    Details::CommandGuid guid;

    bool operator==(const CommandCallKey& other) const {
        return name == other.name && version == other.version && guid == other.guid;
    }
};

}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_COMMANDCALLKEY_H_
