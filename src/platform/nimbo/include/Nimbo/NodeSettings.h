// Nimbo::NodeSettings: how a node's delivery behaves. A plain value, copied into the node when it
// is constructed; later changes to the settings object do not reach the node.
#ifndef NIMBO_NODESETTINGS_H_
#define NIMBO_NODESETTINGS_H_

#include <chrono>

namespace Nimbo {

class NodeSettings {
public:
    NodeSettings() = default;

    // How long the delivery thread (and a SendBinaryAndWait caller) keeps polling before it goes to
    // sleep. Waking a sleeping thread costs tens of microseconds, so a short poll makes
    // request-answer exchanges much faster, at the price of some CPU time after each burst.
    // Zero sleeps at once.
    NodeSettings& SetSpinTime(std::chrono::microseconds spin) {
        spin_ = spin < std::chrono::microseconds::zero() ? std::chrono::microseconds::zero() : spin;
        return *this;
    }
    std::chrono::microseconds GetSpinTime() const { return spin_; }

private:
    std::chrono::microseconds spin_{50};
};

}  // namespace Nimbo

#endif  // NIMBO_NODESETTINGS_H_
