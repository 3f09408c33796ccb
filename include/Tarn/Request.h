// Tarn::Request: a call sent as one message carrying its begin, send and end phases.
//
// Copies share one request; dropping the last copy of a request that was never sent tells the
// server it is abandoned. Copies may be made and dropped from any thread; the other operations
// from one thread at a time.
#ifndef TARN_REQUEST_H_
#define TARN_REQUEST_H_

#include "Tarn/Export.h"

namespace Tarn {

class CommandRequestImpl;
class Parameters;

class TARN_EXPORT Request {
public:
    // Wraps an existing shared request without counting a new reference.
    explicit Request(CommandRequestImpl& impl);
    Request(const Request& other);
    ~Request();
    Request& operator=(const Request&) = delete;

    long Send(const Parameters& begin, const Parameters& send, const Parameters& end);
    long SendAndWait(const Parameters& begin, const Parameters& send, const Parameters& end);
    // Kept by the kernel and delivered when this node disconnects.
    long SendOnDisconnection(const Parameters& begin, const Parameters& send,
                             const Parameters& end);

private:
    CommandRequestImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_REQUEST_H_
