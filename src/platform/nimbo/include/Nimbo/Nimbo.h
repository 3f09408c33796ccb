// The messaging kernel Nimbo: every public header of it, for applications that include one file.
#ifndef NIMBO_NIMBO_H_
#define NIMBO_NIMBO_H_

#include "Nimbo/AtomicInt.h"
#include "Nimbo/Binary.h"
#include "Nimbo/BinaryReader.h"
#include "Nimbo/BinaryWriter.h"
#include "Nimbo/CallbackNode.h"
#include "Nimbo/Channel.h"
#include "Nimbo/Context.h"
#include "Nimbo/FunctionArgs1.h"
#include "Nimbo/Hypervisor.h"
#include "Nimbo/Node.h"
#include "Nimbo/NodeId.h"
#include "Nimbo/NodePool.h"
#include "Nimbo/NodeSettings.h"
#include "Nimbo/NodesLauncher.h"
#include "Nimbo/PrivateServices.h"
#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryReader.h"
#include "Nimbo/TypedBinaryVisitor.h"
#include "Nimbo/TypedBinaryWriter.h"

#endif  // NIMBO_NIMBO_H_
