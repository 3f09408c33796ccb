// The check of a bag against a declared object type, run when a bag takes that type.
#ifndef TARN_SRC_DECLARATIONS_CONSISTENCY_H_
#define TARN_SRC_DECLARATIONS_CONSISTENCY_H_

#include "ZelUnicodeString.h"

namespace Tarn {

class Parameters;

// Checks `parameters` against the declarations of the object type `typeName`; `context` names the
// caller in the published texts. On success the bag may be linked to the type's default values.
long CheckConsistency(Parameters& parameters, const ZelUnicodeString& typeName,
                      const ZelUnicodeString& context);

}  // namespace Tarn

#endif  // TARN_SRC_DECLARATIONS_CONSISTENCY_H_
