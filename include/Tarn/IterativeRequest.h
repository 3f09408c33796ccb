// Tarn::IterativeRequest: a call sent one phase per message: Begin, any number of Send, End.
//
// Copies share one request; dropping the last copy before End tells the server the call is
// abandoned (its end callback is skipped). A second Begin ends the call and fails. Copies may be
// made and dropped from any thread; the other operations from one thread at a time.
#ifndef TARN_ITERATIVEREQUEST_H_
#define TARN_ITERATIVEREQUEST_H_

#include "Tarn/Export.h"

namespace Tarn {

class CommandRequestImpl;
class Parameters;

class TARN_EXPORT IterativeRequest {
public:
    explicit IterativeRequest(CommandRequestImpl& impl);
    IterativeRequest(const IterativeRequest& other);
    ~IterativeRequest();
    IterativeRequest& operator=(const IterativeRequest&) = delete;

    long Begin(const Parameters& p);
    long BeginAndWait(const Parameters& p);
    long Send(const Parameters& p);
    long SendAndWait(const Parameters& p);
    // Ends the call; the handle cannot send afterwards.
    long End(const Parameters& p);
    long EndAndWait(const Parameters& p);

private:
    CommandRequestImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_ITERATIVEREQUEST_H_
