// ResponseHandler: what a pending request or a subscription calls with what arrives for it.
#ifndef TARN_SRC_PROTOCOL_RESPONSEHANDLER_H_
#define TARN_SRC_PROTOCOL_RESPONSEHANDLER_H_

#include "Tarn/Node.h"
#include "Tarn/Response.h"

namespace Tarn {

class Parameters;

struct ResponseHandler {
    static ResponseHandler FromFunction(Node::Callback function) {
        ResponseHandler h;
        h.function = function;
        return h;
    }
    static ResponseHandler FromCallable(const Node::Callable& callable) {
        ResponseHandler h;
        h.callable = callable;
        return h;
    }
    static ResponseHandler FromResponse(const Response& response) {
        ResponseHandler h;
        h.response = response;
        return h;
    }

    // Hands `message` (an answer or an emission) to the function, the callable or the response;
    // `what` names the handler in the report of an exception it throws.
    long Call(Node& node, const Parameters& message, const ZelUnicodeString& what) const;

    Node::Callback function = nullptr;
    Node::Callable callable;
    Response response;
};

}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_RESPONSEHANDLER_H_
