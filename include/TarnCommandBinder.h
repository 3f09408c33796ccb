// TarnCommandBinder: all an application or a command module includes.
#ifndef TARNCOMMANDBINDER_H_
#define TARNCOMMANDBINDER_H_

#include "Nimbo/Nimbo.h"
#include "Tarn/Binary.h"
#include "Tarn/Channel.h"
#include "Tarn/CommandGuid.h"
#include "Tarn/CommandInterface.h"
#include "Tarn/CommandRequest.h"
#include "Tarn/Commands.h"
#include "Tarn/InProcessCommand.h"
#include "Tarn/IterativeRequest.h"
#include "Tarn/Message.h"
#include "Tarn/Node.h"
#include "Tarn/NodeId.h"
#include "Tarn/Parameters.h"
#include "Tarn/ParametersIterator.h"
#include "Tarn/Pool.h"
#include "Tarn/Request.h"
#include "Tarn/Response.h"
#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "ZelUnicodeString.h"

#endif  // TARNCOMMANDBINDER_H_
