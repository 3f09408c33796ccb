#include "Tarn/CommandInterface.h"

#include "Nimbo/ResultCodes.h"
#include "Tarn/InProcessCommand.h"
#include "Tarn/Parameters.h"

namespace Tarn {

CommandInterface::CommandInterface() = default;

CommandInterface::~CommandInterface() = default;

long CommandInterface::operator()(Commands&, Parameters&, Channel&) { return E_FAIL; }

InProcessCommand::InProcessCommand() = default;

InProcessCommand::~InProcessCommand() {
    delete beginDefaults;
    delete sendDefaults;
    delete endDefaults;
}

}  // namespace Tarn
