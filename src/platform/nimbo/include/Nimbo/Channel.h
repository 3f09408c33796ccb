// Nimbo::Channel and Nimbo::ChannelId: where a delivered message came from, and the way back.
//
// Every message reaches OnBinary with the Channel of its sender. AnswerBinary sends on it to the
// sender, whose OnBinary then gets a Channel leading back here. A ChannelId names one direction of
// one pair of nodes: every message that node S sends to node R (requests, emissions, answers and
// the disconnect notices S armed) reaches R with the same ChannelId, and no other pair shares it.
// Ids are strictly ordered, so they can key ordered maps.
//
// Channels and ids are values: copy them and keep them as long as needed. A Channel whose nodes
// have stopped fails to answer. Answering from any thread is safe; one object must not be assigned
// while another thread uses it.
#ifndef NIMBO_CHANNEL_H_
#define NIMBO_CHANNEL_H_

#include <cstdint>
#include <memory>

namespace Nimbo {

class Binary;
class NodeCore;

class ChannelId {
public:
    // The id of no channel; it equals only other default ids.
    ChannelId() = default;
    ChannelId(const ChannelId&) = default;
    ChannelId& operator=(const ChannelId&) = default;

    bool operator==(const ChannelId& other) const {
        return sender_ == other.sender_ && receiver_ == other.receiver_;
    }
    bool operator!=(const ChannelId& other) const { return !(*this == other); }
    bool operator<(const ChannelId& other) const {
        return sender_ != other.sender_ ? sender_ < other.sender_ : receiver_ < other.receiver_;
    }

private:
    friend class Channel;
    ChannelId(std::uint64_t sender, std::uint64_t receiver)
        : sender_(sender), receiver_(receiver) {}

    std::uint64_t sender_ = 0;
    std::uint64_t receiver_ = 0;
};

class Channel {
public:
    // A channel that leads nowhere: AnswerBinary fails.
    Channel();
    Channel(const Channel& other);
    Channel& operator=(const Channel& other);
    ~Channel();

    // Queues `message` for the node that sent the message this channel came with. Fails (E_FAIL)
    // when either node has stopped.
    long AnswerBinary(const Binary& message);

    ChannelId GetId() const;

    bool operator==(const Channel& other) const { return GetId() == other.GetId(); }
    bool operator!=(const Channel& other) const { return !(*this == other); }
    bool operator<(const Channel& other) const { return GetId() < other.GetId(); }

private:
    friend class NodeCore;
    Channel(std::shared_ptr<NodeCore> local, std::shared_ptr<NodeCore> remote);

    std::shared_ptr<NodeCore> local_;   // the node that received, and answers
    std::shared_ptr<NodeCore> remote_;  // the node that sent, and gets the answers
};

}  // namespace Nimbo

#endif  // NIMBO_CHANNEL_H_
