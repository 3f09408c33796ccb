// Tarn::InProcessCommand: a command served inside this process, registered on a Pool with
// Pool::RegisterCommand. It serves every call (every CommandGuid) itself, keeping whatever per-call
// state it needs keyed by the guid. Its operations run on the delivery threads of the pool's nodes
// (several nodes may call it at once, each with its own guids); exceptions are caught and reported.
#ifndef TARN_INPROCESSCOMMAND_H_
#define TARN_INPROCESSCOMMAND_H_

#include "Tarn/CommandGuid.h"
#include "Tarn/Export.h"

namespace Tarn {

class Channel;
class Commands;
class Node;
class Parameters;

class TARN_EXPORT InProcessCommand {
public:
    InProcessCommand();
    virtual ~InProcessCommand();
    InProcessCommand(const InProcessCommand&) = delete;
    InProcessCommand& operator=(const InProcessCommand&) = delete;

    // 0: a call was created; 1: it exists already; negative: the call cannot be served.
    virtual long create(const Details::CommandGuid& guid, Node& node) = 0;
    // Ends the call (delete, a keyword, is spelt destroy).
    virtual long destroy(const Details::CommandGuid& guid) = 0;
    virtual long command(const Details::CommandGuid& guid, Commands& commands,
                         Parameters& parameters, Channel& channel) = 0;
    virtual long begin(const Details::CommandGuid& guid, Parameters& parameters,
                       Channel& channel) = 0;
    virtual long end(const Details::CommandGuid& guid, Parameters& parameters,
                     Channel& channel) = 0;
    virtual long disconnect(const Details::CommandGuid& guid) = 0;

    // Default parameters of the begin, send and end phases, owned by this command, or null.
    // Received parameters are checked against them and then read through them.
    Parameters* beginDefaults = nullptr;
    Parameters* sendDefaults = nullptr;
    Parameters* endDefaults = nullptr;
};

}  // namespace Tarn

#endif  // TARN_INPROCESSCOMMAND_H_
