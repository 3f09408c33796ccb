// CommandRequestImpl: one client request under construction, shared by its handles.
#ifndef TARN_SRC_PROTOCOL_COMMANDREQUESTIMPL_H_
#define TARN_SRC_PROTOCOL_COMMANDREQUESTIMPL_H_

#include <memory>

#include "Nimbo/AtomicInt.h"
#include "Nimbo/NodeId.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class NodeImpl;

class CommandRequestImpl {
public:
    enum State { kNothingBegun = 0, kBegun = 1, kEndAdded = 2, kEnded = 3 };
    enum Phase { kBegin, kSend, kEnd };
    enum Transmit { kSend_, kSendAndWait, kSendOnDisconnection };

    CommandRequestImpl() = default;
    // Abandons an unfinished request: the server ends it without its end callback.
    ~CommandRequestImpl();
    CommandRequestImpl(const CommandRequestImpl&) = delete;
    CommandRequestImpl& operator=(const CommandRequestImpl&) = delete;

    long Setup(NodeImpl& node, const Nimbo::NodeId& target, const ZelUnicodeString& command,
               int version);
    long AddPhase(Phase phase, const Parameters& p);
    long Send(Transmit how);
    void Release();

    const ZelUnicodeString& GetGuid() const { return guid_; }

    Nimbo::AtomicInt references{1};

private:
    void EndNow();
    void ClearPhases();

    NodeImpl* node_ = nullptr;
    Nimbo::NodeId target_;
    ZelUnicodeString command_;
    int version_ = 0;
    ZelUnicodeString guid_;
    std::unique_ptr<Parameters> message_;
    int state_ = kNothingBegun;
};

class CommandRequestInternal {
public:
    static CommandRequestImpl& Impl(CommandRequest& request) { return *request.impl_; }
    static const Response& GetResponse(const CommandRequest& request) {
        return request.response_;
    }
};

}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_COMMANDREQUESTIMPL_H_
