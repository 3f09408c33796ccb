#include "Tarn/Channel.h"

#include "Nimbo/ResultCodes.h"
#include "Tarn/Message.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/ChannelImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

Parameters ChannelImpl::MakeHeader() const {
    Parameters header = ParametersInternal::Make(*types);
    header.WriteUint8(Protocol::kProtocol, Protocol::kVersion);
    if (identity->hasCommand) header.WriteString(Protocol::kCommand, identity->command);
    if (identity->hasVersion) header.WriteInt32(Protocol::kVersionName, identity->version);
    if (identity->hasGuid) header.WriteString(Protocol::kGuid, identity->guid);
    return header;
}

long ChannelImpl::AnswerHeader(const Parameters& header) {
    return kernel.AnswerBinary(header.ToBinary());
}

Channel::Channel(ChannelImpl* impl) : impl_(impl) {}

Channel::Channel(const Channel& other) : impl_(new ChannelImpl(*other.impl_)) {}

Channel& Channel::operator=(const Channel& other) {
    if (this != &other) *impl_ = *other.impl_;
    return *this;
}

Channel::~Channel() { delete impl_; }

bool Channel::operator==(const Channel& other) const {
    return impl_->kernel == other.impl_->kernel;
}

bool Channel::operator!=(const Channel& other) const {
    return impl_->kernel != other.impl_->kernel;
}

bool Channel::operator<(const Channel& other) const { return impl_->kernel < other.impl_->kernel; }

long Channel::Answer(const Parameters& p) {
    if (impl_->types == nullptr || !impl_->identity) return E_FAIL;
    Parameters header = impl_->MakeHeader();
    ParametersInternal::PutObject(header, Protocol::kParams, p);
    return impl_->AnswerHeader(header);
}

long Channel::Answer(const Message& m) {
    if (impl_->types == nullptr || !impl_->identity) return E_FAIL;
    std::vector<ZelUnicodeString> names;
    if (m.GetDomainNames(names) < 0) return E_FAIL;
    Parameters header = impl_->MakeHeader();
    Parameters* params = ParametersInternal::Impl(header).GetOrCreateObject(Protocol::kParams);
    params->WriteStringArray(Protocol::kDomainNames, names);
    ParametersInternal::PutObject(*params, Protocol::kDomains, m.GetDomains());
    return impl_->AnswerHeader(header);
}

}  // namespace Tarn
