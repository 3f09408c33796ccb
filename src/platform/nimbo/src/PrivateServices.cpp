#include "Nimbo/PrivateServices.h"

#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>

#include "Nimbo/Node.h"

namespace Nimbo {
namespace PrivateServices {
namespace {

// Listeners are held by shared_ptr and copied out under the lock, so one is never destroyed while
// another thread still runs it, and no lock is held while it runs.
std::mutex& ListenerLock() {
    static std::mutex lock;
    return lock;
}
std::shared_ptr<const ErrorListener>& ErrorSlot() {
    static std::shared_ptr<const ErrorListener> slot;
    return slot;
}
std::shared_ptr<const MonitorListener>& MonitorSlot() {
    static std::shared_ptr<const MonitorListener> slot;
    return slot;
}

void DefaultError(const ZelUnicodeString& message, const ZelUnicodeString& source) {
    std::fprintf(stderr, "%s: %s\n", source.c_str(), message.c_str());
}

void DefaultMonitor(const ZelUnicodeString& nodeName, const ZelUnicodeString& text, long code) {
    static const bool enabled = std::getenv("NIMBO_MONITOR") != nullptr;
    if (enabled) std::fprintf(stderr, "%s: %s (%ld)\n", nodeName.c_str(), text.c_str(), code);
}

}  // namespace

void PublishError(const Context&, const ZelUnicodeString& message,
                  const ZelUnicodeString& source) {
    std::shared_ptr<const ErrorListener> listener;
    {
        std::lock_guard<std::mutex> hold(ListenerLock());
        listener = ErrorSlot();
    }
    if (listener) {
        (*listener)(message, source);
    } else {
        DefaultError(message, source);
    }
}

void Monitor(const ZelUnicodeString& nodeName, const ZelUnicodeString& text, long code) {
    std::shared_ptr<const MonitorListener> listener;
    {
        std::lock_guard<std::mutex> hold(ListenerLock());
        listener = MonitorSlot();
    }
    if (listener) {
        (*listener)(nodeName, text, code);
    } else {
        DefaultMonitor(nodeName, text, code);
    }
}

void Monitor(Node& node, const ZelUnicodeString& text, long code) {
    Monitor(node.GetName(), text, code);
}

void SetErrorListener(ErrorListener listener) {
    auto held = listener ? std::make_shared<const ErrorListener>(std::move(listener)) : nullptr;
    std::lock_guard<std::mutex> hold(ListenerLock());
    ErrorSlot() = std::move(held);
}

void SetMonitorListener(MonitorListener listener) {
    auto held = listener ? std::make_shared<const MonitorListener>(std::move(listener)) : nullptr;
    std::lock_guard<std::mutex> hold(ListenerLock());
    MonitorSlot() = std::move(held);
}

}  // namespace PrivateServices
}  // namespace Nimbo
