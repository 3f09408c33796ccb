// Tarn::CommandRequest: a call made of send phases only, owned by one handle.
//
// Set it up with Node::CreateCommandRequest; answers go to the Response given at construction.
// Destroying the handle ends the call for the server (without its end callback). One thread at a
// time may use a request.
#ifndef TARN_COMMANDREQUEST_H_
#define TARN_COMMANDREQUEST_H_

#include "Tarn/Export.h"
#include "Tarn/Response.h"

namespace Tarn {

class CommandRequestImpl;
class Parameters;

class TARN_EXPORT CommandRequest {
public:
    explicit CommandRequest(Response response);
    ~CommandRequest();
    CommandRequest(const CommandRequest&) = delete;
    CommandRequest& operator=(const CommandRequest&) = delete;

    long Send(const Parameters& p);
    // Returns once the server has handled the message.
    long SendAndWait(const Parameters& p);

private:
    friend class CommandRequestInternal;
    CommandRequestImpl* impl_;
    Response response_;
};

}  // namespace Tarn

#endif  // TARN_COMMANDREQUEST_H_
