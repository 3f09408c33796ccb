// PoolImpl: the state behind a Tarn::Pool, and the dispatch of command operations to the command
// that serves them: an in-process command registered on the pool, else a deployed command.
#ifndef TARN_SRC_HOSTING_POOLIMPL_H_
#define TARN_SRC_HOSTING_POOLIMPL_H_

#include <map>
#include <memory>
#include <shared_mutex>
#include <utility>

#include "Tarn/InProcessCommand.h"
#include "ZelUnicodeString.h"
#include "protocol/CommandCallKey.h"

namespace Tarn {

class Channel;
class CommandsImpl;
class Node;
class Parameters;
class PoolCommands;

class PoolImpl {
public:
    PoolImpl(const ZelUnicodeString& name, CommandsImpl& commands);
    ~PoolImpl();

    const ZelUnicodeString& GetName() const { return name_; }
    CommandsImpl& GetCommands() const { return commands_; }

    long RegisterCommand(const ZelUnicodeString& name, int version,
                         std::unique_ptr<InProcessCommand> command);
    // The in-process command of (name, version), or null. Commands are never removed while the
    // pool lives, so the pointer stays valid.
    InProcessCommand* FindInProcess(const ZelUnicodeString& name, int version) const;

    // The operations of one call, served by the command of the key's name and version. Each
    // catches what user code throws, reports it and counts it as E_FAIL.
    long Create(const CommandCallKey& key, Node& node);
    // 0 when there is nothing to check or the parameters pass; negative (reported) otherwise.
    long Check(int phase, const CommandCallKey& key, Parameters& parameters);
    long Begin(const CommandCallKey& key, Parameters& parameters, Channel& channel);
    long Command(const CommandCallKey& key, Parameters& parameters, Channel& channel);
    long End(const CommandCallKey& key, Parameters& parameters, Channel& channel);
    long Disconnect(const CommandCallKey& key);
    long Delete(const CommandCallKey& key);

    PoolCommands* poolCommands = nullptr;

private:
    // Runs `call` (user code), turning an escaping exception into a report and E_FAIL.
    template <typename Call>
    long Guarded(const CommandCallKey& key, const char* operation, Call call);

    ZelUnicodeString name_;
    CommandsImpl& commands_;
    mutable std::shared_mutex lock_;
    std::map<std::pair<ZelUnicodeString, int>, std::unique_ptr<InProcessCommand>> inProcess_;
};

}  // namespace Tarn

#endif  // TARN_SRC_HOSTING_POOLIMPL_H_
