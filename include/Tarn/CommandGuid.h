// Tarn::Details::CommandGuid: the identity of one command instance on a serving node, the guid
// the caller chose together with the channel the request arrived on (two callers may pick the same
// guid text; their channels keep them apart).
#ifndef TARN_COMMANDGUID_H_
#define TARN_COMMANDGUID_H_

#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Nimbo {
class ChannelId;
}

namespace Tarn {
namespace Details {

class TARN_EXPORT CommandGuid {
public:
    CommandGuid();
    CommandGuid(const ZelUnicodeString& guid, const Nimbo::ChannelId& channel);
    CommandGuid(const CommandGuid& other);
    CommandGuid& operator=(const CommandGuid& other);
    ~CommandGuid();

    bool operator==(const CommandGuid& other) const;
    bool operator!=(const CommandGuid& other) const { return !(*this == other); }
    // Channel first, then guid.
    bool operator<(const CommandGuid& other) const;

    const ZelUnicodeString& GetGuid() const { return guid_; }
    const Nimbo::ChannelId& GetChannelId() const { return *channel_; }

private:
    friend class CommandGuidInternal;
    ZelUnicodeString guid_;
    Nimbo::ChannelId* channel_;
};

}  // namespace Details
}  // namespace Tarn

#endif  // TARN_COMMANDGUID_H_
