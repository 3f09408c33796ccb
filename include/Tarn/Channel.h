// Tarn::Channel: the way back to the caller of one request, handed to the command serving it.
//
// A Channel carries the identity (command, version, guid) of the request it was made for, so an
// answer always reaches its own caller, also after the node has received other requests and from
// any thread. Copies are cheap and independent.
#ifndef TARN_CHANNEL_H_
#define TARN_CHANNEL_H_

#include "Tarn/Export.h"

namespace Tarn {

class ChannelImpl;
class Message;
class Parameters;

class TARN_EXPORT Channel {
public:
    Channel(const Channel& other);
    Channel& operator=(const Channel& other);
    ~Channel();

    // Compare the kernel channels.
    bool operator==(const Channel& other) const;
    bool operator!=(const Channel& other) const;
    bool operator<(const Channel& other) const;

    // Sends `p` to the caller as one answer.
    long Answer(const Parameters& p);
    // Sends the domains of `m` to the caller; fails when `m` has none.
    long Answer(const Message& m);

private:
    friend class ChannelInternal;
    explicit Channel(ChannelImpl* impl);

    ChannelImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_CHANNEL_H_
