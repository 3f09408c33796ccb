// FactoryCommand: serves in-process a command written for a module: one CommandInterface per call,
// made by a factory and released with delete.
#ifndef TARN_SRC_PROTOCOL_FACTORYCOMMAND_H_
#define TARN_SRC_PROTOCOL_FACTORYCOMMAND_H_

#include <functional>
#include <map>
#include <memory>
#include <mutex>

#include "Tarn/CommandInterface.h"
#include "Tarn/InProcessCommand.h"

namespace Tarn {

class FactoryCommand : public InProcessCommand {
public:
    explicit FactoryCommand(std::function<CommandInterface*(Node&)> factory)
        : factory_(std::move(factory)) {}

    long create(const Details::CommandGuid& guid, Node& node) override;
    long destroy(const Details::CommandGuid& guid) override;
    long command(const Details::CommandGuid& guid, Commands& commands, Parameters& parameters,
                 Channel& channel) override;
    long begin(const Details::CommandGuid& guid, Parameters& parameters,
               Channel& channel) override;
    long end(const Details::CommandGuid& guid, Parameters& parameters, Channel& channel) override;
    long disconnect(const Details::CommandGuid& guid) override;

private:
    // The instance of a call, or null. Calls of one guid come from one node's delivery thread,
    // so the instance is used without the lock, which only guards the table.
    CommandInterface* Find(const Details::CommandGuid& guid);

    std::function<CommandInterface*(Node&)> factory_;
    std::mutex lock_;
    std::map<Details::CommandGuid, std::unique_ptr<CommandInterface>> instances_;
};

}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_FACTORYCOMMAND_H_
