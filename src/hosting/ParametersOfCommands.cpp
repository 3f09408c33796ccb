// The Parameters constructors that take their registry from a Commands.
#include "Tarn/Binary.h"
#include "Tarn/Commands.h"
#include "Tarn/Parameters.h"
#include "hosting/CommandsImpl.h"

namespace Tarn {

Parameters::Parameters(const Commands& commands)
    : Parameters(CommandsInternal::GetTypes(commands)) {}

Parameters::Parameters(const Commands& commands, const Binary& bytes)
    : Parameters(CommandsInternal::GetTypes(commands), bytes) {}

Parameters::Parameters(const Commands& commands, const Nimbo::Binary& bytes)
    : Parameters(CommandsInternal::GetTypes(commands), bytes) {}

}  // namespace Tarn
