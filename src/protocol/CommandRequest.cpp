#include "protocol/CommandRequestImpl.h"

#include "Nimbo/ResultCodes.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/Request.h"
#include "hosting/NodeImpl.h"
#include "parameters/ParametersImpl.h"
#include "protocol/ProtocolMessage.h"

namespace Tarn {

CommandRequestImpl::~CommandRequestImpl() {
    if (!message_) return;
    message_->WriteUint8(Protocol::kEnd, Protocol::kAbandoned);
    if (node_ != nullptr && state_ != kEnded) {
        if (Nimbo::Node* kernel = node_->GetKernelNode()) {
            kernel->SendBinary(target_, message_->ToBinary());
        }
    }
}

long CommandRequestImpl::Setup(NodeImpl& node, const Nimbo::NodeId& target,
                               const ZelUnicodeString& command, int version) {
    if (command.IsEmpty()) return E_FAIL;
    node_ = &node;
    target_ = target;
    command_ = command;
    version_ = version;
    if (target.GetStatus() == 0) return E_FAIL;
    guid_ = Protocol::MakeGuid();
    if (!message_) {
        message_ = std::make_unique<Parameters>(ParametersInternal::Make(node.GetTypesImpl()));
        message_->WriteString(Protocol::kCommand, command_);
        message_->WriteString(Protocol::kGuid, guid_);
        message_->WriteInt32(Protocol::kVersionName, version_);
        message_->WriteUint8(Protocol::kProtocol, Protocol::kVersion);
    }
    return S_OK;
}

long CommandRequestImpl::AddPhase(Phase phase, const Parameters& p) {
    if (phase == kBegin && state_ == kBegun) {
        EndNow();
        return E_FAIL;
    }
    if (phase == kBegin) state_ = kBegun;
    if (phase == kEnd) state_ = kEndAdded;
    if (!message_) return E_FAIL;
    const ZelUnicodeString& name =
        phase == kBegin ? Protocol::kBegin : phase == kSend ? Protocol::kSend : Protocol::kEnd;
    return Protocol::WritePhase(*message_, name, p);
}

void CommandRequestImpl::EndNow() {
    if (!message_ || node_ == nullptr || state_ == kEnded) return;
    message_->WriteUint8(Protocol::kEnd,
                         state_ == kBegun ? Protocol::kPhase : Protocol::kAbandoned);
    if (Nimbo::Node* kernel = node_->GetKernelNode()) {
        kernel->SendBinary(target_, message_->ToBinary());
    }
    ClearPhases();
    state_ = kEnded;
}

void CommandRequestImpl::ClearPhases() {
    Protocol::RemovePhase(*message_, Protocol::kBegin);
    Protocol::RemovePhase(*message_, Protocol::kSend);
    Protocol::RemovePhase(*message_, Protocol::kEnd);
}

long CommandRequestImpl::Send(Transmit how) {
    if (!message_ || node_ == nullptr || state_ == kEnded) return E_FAIL;
    Nimbo::Node* kernel = node_->GetKernelNode();
    long result = E_FAIL;
    if (kernel != nullptr) {
        Nimbo::Binary bytes = message_->ToBinary();
        switch (how) {
            case kSend_: result = kernel->SendBinary(target_, bytes); break;
            case kSendAndWait: result = kernel->SendBinaryAndWait(target_, bytes); break;
            case kSendOnDisconnection:
                result = kernel->SendBinaryOnDisconnection(target_, bytes);
                break;
        }
    }
    ClearPhases();
    if (state_ == kEndAdded) state_ = kEnded;
    return result;
}

void CommandRequestImpl::Release() {
    message_.reset();
    node_ = nullptr;
}

// --- Handles -------------------------------------------------------------------------------------

namespace {

void Drop(CommandRequestImpl* impl) {
    if (impl != nullptr && impl->references.Decrement() == 0) delete impl;
}

long AddAndSend(CommandRequestImpl& impl, CommandRequestImpl::Phase phase, const Parameters& p,
                CommandRequestImpl::Transmit how) {
    if (impl.AddPhase(phase, p) < 0) return E_FAIL;
    return impl.Send(how);
}

long SendAll(CommandRequestImpl& impl, const Parameters& begin, const Parameters& send,
             const Parameters& end, CommandRequestImpl::Transmit how) {
    if (impl.AddPhase(CommandRequestImpl::kBegin, begin) < 0 ||
        impl.AddPhase(CommandRequestImpl::kSend, send) < 0 ||
        impl.AddPhase(CommandRequestImpl::kEnd, end) < 0) {
        return E_FAIL;
    }
    long result = impl.Send(how);
    impl.Release();
    return result;
}

}  // namespace

CommandRequest::CommandRequest(Response response)
    : impl_(new CommandRequestImpl()), response_(std::move(response)) {}

CommandRequest::~CommandRequest() { delete impl_; }

long CommandRequest::Send(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kSend, p, CommandRequestImpl::kSend_);
}

long CommandRequest::SendAndWait(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kSend, p, CommandRequestImpl::kSendAndWait);
}

Request::Request(CommandRequestImpl& impl) : impl_(&impl) {}

Request::Request(const Request& other) : impl_(other.impl_) { impl_->references.Increment(); }

Request::~Request() { Drop(impl_); }

long Request::Send(const Parameters& begin, const Parameters& send, const Parameters& end) {
    return SendAll(*impl_, begin, send, end, CommandRequestImpl::kSend_);
}

long Request::SendAndWait(const Parameters& begin, const Parameters& send,
                          const Parameters& end) {
    return SendAll(*impl_, begin, send, end, CommandRequestImpl::kSendAndWait);
}

long Request::SendOnDisconnection(const Parameters& begin, const Parameters& send,
                                  const Parameters& end) {
    return SendAll(*impl_, begin, send, end, CommandRequestImpl::kSendOnDisconnection);
}

IterativeRequest::IterativeRequest(CommandRequestImpl& impl) : impl_(&impl) {}

IterativeRequest::IterativeRequest(const IterativeRequest& other) : impl_(other.impl_) {
    impl_->references.Increment();
}

IterativeRequest::~IterativeRequest() { Drop(impl_); }

long IterativeRequest::Begin(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kBegin, p, CommandRequestImpl::kSend_);
}

long IterativeRequest::BeginAndWait(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kBegin, p, CommandRequestImpl::kSendAndWait);
}

long IterativeRequest::Send(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kSend, p, CommandRequestImpl::kSend_);
}

long IterativeRequest::SendAndWait(const Parameters& p) {
    return AddAndSend(*impl_, CommandRequestImpl::kSend, p, CommandRequestImpl::kSendAndWait);
}

long IterativeRequest::End(const Parameters& p) {
    long result = AddAndSend(*impl_, CommandRequestImpl::kEnd, p, CommandRequestImpl::kSend_);
    impl_->Release();
    return result;
}

long IterativeRequest::EndAndWait(const Parameters& p) {
    long result =
        AddAndSend(*impl_, CommandRequestImpl::kEnd, p, CommandRequestImpl::kSendAndWait);
    impl_->Release();
    return result;
}

}  // namespace Tarn
