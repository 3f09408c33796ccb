// TarnCommandBinder: all an application or a command module includes.
#ifndef TARNCOMMANDBINDER_H_
#define TARNCOMMANDBINDER_H_

#include "Nimbo/Binary.h"
#include "Nimbo/Context.h"
#include "Nimbo/PrivateServices.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Binary.h"
#include "Tarn/Parameters.h"
#include "Tarn/ParametersIterator.h"
#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "ZelUnicodeString.h"

#endif  // TARNCOMMANDBINDER_H_
