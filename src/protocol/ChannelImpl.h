// ChannelImpl: the kernel channel of a request and the identity its answers carry.
#ifndef TARN_SRC_PROTOCOL_CHANNELIMPL_H_
#define TARN_SRC_PROTOCOL_CHANNELIMPL_H_

#include <memory>

#include "Nimbo/Channel.h"
#include "Tarn/Channel.h"
#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class TypesImpl;

// What the reply header of the serving node held for the request: "command", "version" and
// "guid" (an end-only first message leaves "command" and "version" as an earlier request wrote
// them, or absent).
struct ReplyIdentity {
    bool hasCommand = false;
    ZelUnicodeString command;
    bool hasVersion = false;
    int version = 0;
    bool hasGuid = false;
    ZelUnicodeString guid;
};

class ChannelImpl {
public:
    ChannelImpl(const Nimbo::Channel& kernel, std::shared_ptr<const ReplyIdentity> identity,
                const TypesImpl* types)
        : kernel(kernel), identity(std::move(identity)), types(types) {}

    // "protocol" = 1 and the identity of the request.
    Parameters MakeHeader() const;
    long AnswerHeader(const Parameters& header);

    Nimbo::Channel kernel;
    std::shared_ptr<const ReplyIdentity> identity;
    const TypesImpl* types;
};

class ChannelInternal {
public:
    static Channel Make(const Nimbo::Channel& kernel, std::shared_ptr<const ReplyIdentity> identity,
                        const TypesImpl& types) {
        return Channel(new ChannelImpl(kernel, std::move(identity), &types));
    }
    static ChannelImpl& Impl(const Channel& channel) { return *channel.impl_; }
};

}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_CHANNELIMPL_H_
