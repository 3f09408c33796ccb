// Nimbo::PrivateServices: the kernel's error publication and monitoring.
//
// Both go to process-wide listeners. The defaults: an error prints one line "<source>: <message>"
// to stderr; a monitor line is dropped unless the environment variable NIMBO_MONITOR is set, then
// it prints "<node name>: <text> (<code>)" to stderr. A listener may be replaced at any time from
// any thread; an empty function restores the default. Listeners may be called from several threads
// at once and must not call the setters.
#ifndef NIMBO_PRIVATESERVICES_H_
#define NIMBO_PRIVATESERVICES_H_

#include <functional>

#include "ZelUnicodeString.h"

namespace Nimbo {

class Context;
class Node;

namespace PrivateServices {

using ErrorListener =
    std::function<void(const ZelUnicodeString& message, const ZelUnicodeString& source)>;
using MonitorListener = std::function<void(const ZelUnicodeString& nodeName,
                                           const ZelUnicodeString& text, long code)>;

void PublishError(const Context& context, const ZelUnicodeString& message,
                  const ZelUnicodeString& source);
void Monitor(Node& node, const ZelUnicodeString& text, long code);
// The same for a node known by its name only.
void Monitor(const ZelUnicodeString& nodeName, const ZelUnicodeString& text, long code);

void SetErrorListener(ErrorListener listener);
void SetMonitorListener(MonitorListener listener);

}  // namespace PrivateServices
}  // namespace Nimbo

#endif  // NIMBO_PRIVATESERVICES_H_
