#include "Tarn/CommandGuid.h"

#include "Nimbo/Channel.h"

namespace Tarn {
namespace Details {

CommandGuid::CommandGuid() : channel_(new Nimbo::ChannelId()) {}

CommandGuid::CommandGuid(const ZelUnicodeString& guid, const Nimbo::ChannelId& channel)
    : guid_(guid), channel_(new Nimbo::ChannelId(channel)) {}

CommandGuid::CommandGuid(const CommandGuid& other)
    : guid_(other.guid_), channel_(new Nimbo::ChannelId(*other.channel_)) {}

CommandGuid& CommandGuid::operator=(const CommandGuid& other) {
    guid_ = other.guid_;
    *channel_ = *other.channel_;
    return *this;
}

CommandGuid::~CommandGuid() { delete channel_; }

bool CommandGuid::operator==(const CommandGuid& other) const {
    return guid_ == other.guid_ && *channel_ == *other.channel_;
}

bool CommandGuid::operator<(const CommandGuid& other) const {
    if (*channel_ != *other.channel_) return *channel_ < *other.channel_;
    return guid_ < other.guid_;
}

}  // namespace Details
}  // namespace Tarn
