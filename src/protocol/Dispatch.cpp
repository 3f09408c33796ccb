// The incoming-message entry of a node: requests served by the pool's commands, answers to this
// node's own requests, events it subscribed to, and disconnect notices of its callers.
#include "Nimbo/ResultCodes.h"
#include "Tarn/Channel.h"
#include "Tarn/TypesImpl.h"
#include "hosting/CommandsImpl.h"
#include "hosting/NodeImpl.h"
#include "hosting/PoolImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/ChannelImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {
namespace {

ZelUnicodeString Line(const char* before, const ZelUnicodeString& name, const char* middle,
                      const ZelUnicodeString& guid) {
    return before + name + middle + guid + ">";
}

}  // namespace

long NodeImpl::OnIncoming(const Nimbo::Binary& bytes, Nimbo::Channel& channel) {
    Parameters message = ParametersInternal::Make(GetTypesImpl());
    if (ParametersInternal::FromBinary(message, bytes) < 0) {
        // Acting on part of a message could run half a request: refuse it whole.
        GetTypesImpl().PublishError(
            "Tarn : Undecodable message refused, " +
            ZelUnicodeString().BuildFromNum(bytes.GetSize(), "%u") + " bytes");
        return E_FAIL;
    }
    if (GetKernelNode() == nullptr) return E_FAIL;
    if (!Protocol::CheckVersion(message, GetTypesImpl())) return E_FAIL;
    ZelUnicodeString event;
    switch (Protocol::Classify(message, event)) {
        case Protocol::Kind::Disconnect:
            return HandleDisconnect(channel);
        case Protocol::Kind::Emission:
            return ReceiveEmission(event, message);
        case Protocol::Kind::RequestOrAnswer:
            break;
    }
    bool noPhase = false;
    long result = HandleRequest(message, channel, noPhase);
    return noPhase ? ReceiveAnswer(message) : result;
}

long NodeImpl::HandleRequest(const Parameters& constMessage, Nimbo::Channel& kernelChannel,
                             bool& noPhase) {
    Parameters& message = const_cast<Parameters&>(constMessage);
    const Protocol::Phase begin = Protocol::ReadPhase(message, Protocol::kBegin);
    const Protocol::Phase send = Protocol::ReadPhase(message, Protocol::kSend);
    const Protocol::Phase end = Protocol::ReadPhase(message, Protocol::kEnd);
    if (begin.marker == Protocol::kNoPhase && send.marker == Protocol::kNoPhase &&
        end.marker == Protocol::kNoPhase) {
        noPhase = true;
        return E_FAIL;
    }

    const ParametersImpl& impl = ParametersInternal::Impl(message);
    auto command = impl.strings.find(Protocol::kCommand);
    auto version = impl.int32s.find(Protocol::kVersionName);
    auto guid = impl.strings.find(Protocol::kGuid);
    if (GetKernelNode() == nullptr || command == impl.strings.end() ||
        version == impl.int32s.end() || guid == impl.strings.end()) {
        return E_FAIL;
    }
    CommandCallKey key;
    key.name = command->second;
    key.version = version->second;
    key.guid = Details::CommandGuid(guid->second, kernelChannel.GetId());

    // The reply header records the call; an end-only message changes only its guid. The channel
    // keeps what it holds now, so its answers reach this caller whatever arrives later.
    auto identity = std::make_shared<ReplyIdentity>();
    {
        std::lock_guard<std::mutex> hold(lock_);
        if (begin.marker != Protocol::kNoPhase || send.marker != Protocol::kNoPhase) {
            replyHeader_.WriteString(Protocol::kCommand, key.name);
            replyHeader_.WriteInt32(Protocol::kVersionName, key.version);
        }
        replyHeader_.WriteString(Protocol::kGuid, key.guid.GetGuid());
        const ParametersImpl& header = ParametersInternal::Impl(replyHeader_);
        auto c = header.strings.find(Protocol::kCommand);
        auto v = header.int32s.find(Protocol::kVersionName);
        identity->hasCommand = c != header.strings.end();
        if (identity->hasCommand) identity->command = c->second;
        identity->hasVersion = v != header.int32s.end();
        if (identity->hasVersion) identity->version = v->second;
        identity->hasGuid = true;
        identity->guid = key.guid.GetGuid();
    }
    Channel channel = ChannelInternal::Make(kernelChannel, identity, GetTypesImpl());

    long created = pool_.Create(key, node_);
    if (created == S_OK) {
        Log(Line("Command <", key.name, "> created with guid <", key.guid.GetGuid()), 0);
        if (end.marker != Protocol::kAbandoned) {
            std::lock_guard<std::mutex> hold(lock_);
            liveCalls_[kernelChannel.GetId()].push_back(key);
        }
    } else if (created < 0) {
        GetTypesImpl().PublishError("Unknow Command " + key.name);
        return Delete(key, channel);
    }

    // Phases without parameters get an empty bag.
    Parameters empty = ParametersInternal::Make(GetTypesImpl());
    auto parametersOf = [&empty](const Protocol::Phase& phase) -> Parameters& {
        return phase.parameters != nullptr ? *phase.parameters : empty;
    };

    // A phase whose parameters fail the check ends the call: its callback and every later phase
    // are skipped, and the instance is deleted and revoked.
    if (begin.marker != Protocol::kNoPhase) {
        Parameters& p = parametersOf(begin);
        if (pool_.Check(0, key, p) < 0) return Delete(key, channel);
        long r = pool_.Begin(key, p, channel);
        Log(Line("<", key.name, ">::OnBegin() called, guid <", key.guid.GetGuid()), r);
    }
    if (send.marker != Protocol::kNoPhase) {
        Parameters& p = parametersOf(send);
        if (pool_.Check(1, key, p) < 0) return Delete(key, channel);
        long r = pool_.Command(key, p, channel);
        Log(Line("<", key.name, ">::OnCommand() called, guid <", key.guid.GetGuid()), r);
    }
    if (end.marker == Protocol::kNoPhase) return S_OK;
    if (end.marker != Protocol::kAbandoned) {
        Parameters& p = parametersOf(end);
        if (pool_.Check(2, key, p) >= 0) {
            long r = pool_.End(key, p, channel);
            Log(Line("<", key.name, ">::OnEnd() called, guid <", key.guid.GetGuid()), r);
        }
    }
    return Delete(key, channel);
}

long NodeImpl::Delete(const CommandCallKey& key, Channel& channel) {
    long result = pool_.Delete(key);
    if (result >= 0 && GetKernelNode() != nullptr) {
        Log(Line("Command <", key.name, "> deleted, guid <", key.guid.GetGuid()), result);
    }
    RemoveLiveCall(key);
    ChannelImpl& impl = ChannelInternal::Impl(channel);
    Parameters revoke = impl.MakeHeader();
    revoke.WriteInt8(Protocol::kRevoke, 1);
    impl.AnswerHeader(revoke);
    return result;
}

void NodeImpl::RemoveLiveCall(const CommandCallKey& key) {
    std::lock_guard<std::mutex> hold(lock_);
    auto calls = liveCalls_.find(key.guid.GetChannelId());
    if (calls == liveCalls_.end()) return;
    for (auto it = calls->second.begin(); it != calls->second.end(); ++it) {
        if (*it == key) {
            calls->second.erase(it);
            break;
        }
    }
    if (calls->second.empty()) liveCalls_.erase(calls);
}

long NodeImpl::HandleDisconnect(Nimbo::Channel& channel) {
    if (GetKernelNode() == nullptr) return E_FAIL;
    std::vector<CommandCallKey> keys;
    {
        std::lock_guard<std::mutex> hold(lock_);
        auto calls = liveCalls_.find(channel.GetId());
        if (calls == liveCalls_.end()) return S_OK;
        keys.swap(calls->second);
        liveCalls_.erase(calls);
    }
    for (const CommandCallKey& key : keys) {
        long r = pool_.Disconnect(key);
        Log(Line("<", key.name, ">::OnDisconnect() called, guid <", key.guid.GetGuid()), r);
    }
    return S_OK;
}

long NodeImpl::ReceiveAnswer(const Parameters& message) {
    const ParametersImpl& impl = ParametersInternal::Impl(message);
    auto guid = impl.strings.find(Protocol::kGuid);
    if (impl.int8s.count(Protocol::kRevoke) != 0) {
        if (guid != impl.strings.end()) {
            std::lock_guard<std::mutex> hold(lock_);
            pending_.erase(guid->second);
        }
        return S_OK;
    }
    if (guid == impl.strings.end()) return E_FAIL;
    std::shared_ptr<const ResponseHandler> handler;
    {
        std::lock_guard<std::mutex> hold(lock_);
        auto found = pending_.find(guid->second);
        if (found == pending_.end()) return S_OK;
        handler = found->second;
    }
    handler->Call(node_, message, "Answer handler of request <" + guid->second + ">");
    return S_OK;
}

long NodeImpl::ReceiveEmission(const ZelUnicodeString& name, const Parameters& message) {
    std::shared_ptr<const ResponseHandler> handler;
    {
        std::lock_guard<std::mutex> hold(lock_);
        auto found = subscriptions_.find(name);
        if (found == subscriptions_.end()) return E_FAIL;
        handler = found->second;
    }
    return handler->Call(node_, message, "Subscription handler of event <" + name + ">");
}

}  // namespace Tarn
