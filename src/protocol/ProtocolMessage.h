// The messages nodes exchange: each is one encoded Parameters whose properties say what it is.
//
//   request     client -> server   "command" "version" "guid" "protocol" + one or more phases
//                                  ("beginParameters", "sendParameters", "endParameters": a nested
//                                  bag, or uint8 1 for an empty one, or "endParameters" = uint8 2
//                                  for an abandoned call)
//   answer      server -> client   "protocol" "command" "version" "guid" + "Params"
//   revoke      server -> client   "protocol" "command" "version" "guid" + "revoke" = int8 1
//   emission    emitter -> subscribers  "emit" "protocol" + "Params", or "domainNames" "domains"
//   disconnect  kernel -> selected node, armed by the selecting one: "disconnect" = int8 0
//
// Every message carries "protocol" = uint8 1.
#ifndef TARN_SRC_PROTOCOL_PROTOCOLMESSAGE_H_
#define TARN_SRC_PROTOCOL_PROTOCOLMESSAGE_H_

#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class TypesImpl;

namespace Protocol {

constexpr unsigned char kVersion = 1;

extern const ZelUnicodeString kProtocol;
extern const ZelUnicodeString kCommand;
extern const ZelUnicodeString kVersionName;
extern const ZelUnicodeString kGuid;
extern const ZelUnicodeString kBegin;
extern const ZelUnicodeString kSend;
extern const ZelUnicodeString kEnd;
extern const ZelUnicodeString kParams;
extern const ZelUnicodeString kDomainNames;
extern const ZelUnicodeString kDomains;
extern const ZelUnicodeString kRevoke;
extern const ZelUnicodeString kEmit;
extern const ZelUnicodeString kDisconnect;

// Phase markers: absent, present (with or without parameters), abandoned (end only).
constexpr unsigned char kNoPhase = 0;
constexpr unsigned char kPhase = 1;
constexpr unsigned char kAbandoned = 2;

// One phase of a received request: its marker and, for a nested bag, the bag inside the message.
struct Phase {
    unsigned char marker = kNoPhase;
    Parameters* parameters = nullptr;
};
Phase ReadPhase(Parameters& message, const ZelUnicodeString& name);

// Writes a phase: `p` as a nested bag, or the marker 1 when `p` is empty.
long WritePhase(Parameters& message, const ZelUnicodeString& name, const Parameters& p);
// Removes a phase in both its forms.
void RemovePhase(Parameters& message, const ZelUnicodeString& name);

// Refuses an empty message silently and a message of another protocol version with a report.
bool CheckVersion(const Parameters& message, const TypesImpl& types);

enum class Kind { Disconnect, Emission, RequestOrAnswer };
// Disconnect notice first, then emission; everything else is a request or, without a phase, an
// answer. `emitName` receives the event name of an emission.
Kind Classify(const Parameters& message, ZelUnicodeString& emitName);

// A new request guid, "{xxxxxxxx-xxxx-xxxx-xxxx-xxxxxxxxxxxx}": 38 characters, drawn from the
// library's own generator, so the application's rand() sequence is left alone.
ZelUnicodeString MakeGuid();

}  // namespace Protocol
}  // namespace Tarn

#endif  // TARN_SRC_PROTOCOL_PROTOCOLMESSAGE_H_
