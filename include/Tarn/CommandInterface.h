// Tarn::CommandInterface: the base class of every command implementation.
//
// One instance serves one call: it is created when the call's first message arrives, receives the
// parameters of each phase with the Channel through which it answers, and is deleted after the end
// phase. Its callbacks run on the serving node's delivery thread, one at a time; an exception that
// escapes one is caught, reported and counted as a failure.
#ifndef TARN_COMMANDINTERFACE_H_
#define TARN_COMMANDINTERFACE_H_

#include "Tarn/Export.h"

namespace Tarn {

class Channel;
class Commands;
class Parameters;

class TARN_EXPORT CommandInterface {
public:
    CommandInterface();
    virtual ~CommandInterface();

    virtual long OnBegin(Parameters& parameters, Channel& channel) = 0;
    virtual long OnCommand(Parameters& parameters, Channel& channel) = 0;
    virtual long OnEnd(Parameters& parameters, Channel& channel) = 0;
    // The caller's side has gone; the instance is not deleted by this.
    virtual long OnDisconnect() = 0;

    // Does nothing and fails.
    long operator()(Commands& commands, Parameters& parameters, Channel& channel);
};

}  // namespace Tarn

#endif  // TARN_COMMANDINTERFACE_H_
