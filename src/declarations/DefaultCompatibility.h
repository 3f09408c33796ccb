// The check of received parameters against the default parameters of an in-process command.
#ifndef TARN_SRC_DECLARATIONS_DEFAULTCOMPATIBILITY_H_
#define TARN_SRC_DECLARATIONS_DEFAULTCOMPATIBILITY_H_

#include "ZelUnicodeString.h"

namespace Tarn {

class Parameters;
class TypesImpl;

// When every received property exists with the same kind in `defaults`, links `received` to
// `defaults` and returns 0. Otherwise publishes one report of the incompatible properties through
// `types` and returns E_FAIL.
long ReportDefaultIncompatibility(const ZelUnicodeString& commandName, Parameters& defaults,
                                  Parameters& received, const TypesImpl& types);

}  // namespace Tarn

#endif  // TARN_SRC_DECLARATIONS_DEFAULTCOMPATIBILITY_H_
