#include "Nimbo/Channel.h"

#include <utility>

#include "Nimbo/ResultCodes.h"
#include "NodeCore.h"

namespace Nimbo {

Channel::Channel() = default;
Channel::Channel(const Channel& other) = default;
Channel& Channel::operator=(const Channel& other) = default;
Channel::~Channel() = default;

Channel::Channel(std::shared_ptr<NodeCore> local, std::shared_ptr<NodeCore> remote)
    : local_(std::move(local)), remote_(std::move(remote)) {}

long Channel::AnswerBinary(const Binary& message) {
    if (local_ == nullptr || remote_ == nullptr || !local_->IsRunning()) return E_FAIL;
    return remote_->Enqueue(message, local_, nullptr);
}

ChannelId Channel::GetId() const {
    if (local_ == nullptr || remote_ == nullptr) return ChannelId();
    return ChannelId(remote_->GetSerial(), local_->GetSerial());
}

}  // namespace Nimbo
