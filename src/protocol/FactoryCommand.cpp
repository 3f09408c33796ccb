#include "protocol/FactoryCommand.h"

#include "Nimbo/ResultCodes.h"

namespace Tarn {

long FactoryCommand::create(const Details::CommandGuid& guid, Node& node) {
    {
        std::lock_guard<std::mutex> hold(lock_);
        if (instances_.count(guid) != 0) return S_FALSE;
    }
    std::unique_ptr<CommandInterface> instance(factory_ ? factory_(node) : nullptr);
    if (!instance) return E_FAIL;
    std::lock_guard<std::mutex> hold(lock_);
    instances_.emplace(guid, std::move(instance));
    return S_OK;
}

long FactoryCommand::destroy(const Details::CommandGuid& guid) {
    std::unique_ptr<CommandInterface> instance;
    {
        std::lock_guard<std::mutex> hold(lock_);
        auto found = instances_.find(guid);
        if (found == instances_.end()) return E_FAIL;
        instance = std::move(found->second);
        instances_.erase(found);
    }
    // The destructor is user code: run it outside the lock.
    instance.reset();
    return S_OK;
}

CommandInterface* FactoryCommand::Find(const Details::CommandGuid& guid) {
    std::lock_guard<std::mutex> hold(lock_);
    auto found = instances_.find(guid);
    return found != instances_.end() ? found->second.get() : nullptr;
}

long FactoryCommand::command(const Details::CommandGuid& guid, Commands&, Parameters& parameters,
                             Channel& channel) {
    CommandInterface* instance = Find(guid);
    return instance != nullptr ? instance->OnCommand(parameters, channel) : E_FAIL;
}

long FactoryCommand::begin(const Details::CommandGuid& guid, Parameters& parameters,
                           Channel& channel) {
    CommandInterface* instance = Find(guid);
    return instance != nullptr ? instance->OnBegin(parameters, channel) : E_FAIL;
}

long FactoryCommand::end(const Details::CommandGuid& guid, Parameters& parameters,
                         Channel& channel) {
    CommandInterface* instance = Find(guid);
    return instance != nullptr ? instance->OnEnd(parameters, channel) : E_FAIL;
}

long FactoryCommand::disconnect(const Details::CommandGuid& guid) {
    CommandInterface* instance = Find(guid);
    return instance != nullptr ? instance->OnDisconnect() : E_FAIL;
}

}  // namespace Tarn
