// NodeAdapter: the kernel node of a Tarn::Node. The kernel calls OnBinary with every message; the
// adapter passes it to its NodeImpl while bound, and drops it once teardown has cut it off.
#ifndef TARN_SRC_HOSTING_NODEADAPTER_H_
#define TARN_SRC_HOSTING_NODEADAPTER_H_

#include <atomic>

#include "Nimbo/CallbackNode.h"
#include "Nimbo/Node.h"
#include "hosting/NodeImpl.h"

namespace Tarn {

template <typename Base>
class NodeAdapter : public Base {
public:
    explicit NodeAdapter(const ZelUnicodeString& name) : Base(name), name_(name) {
        Base::AllowWebAccess();
    }
    NodeAdapter(const ZelUnicodeString& name, const Nimbo::NodeSettings& settings)
        : Base(name, settings), name_(name) {
        Base::AllowWebAccess();
    }

    long OnBinary(const Nimbo::Binary& message, Nimbo::Channel& channel) override {
        NodeImpl* node = node_.load(std::memory_order_acquire);
        if (node != nullptr) node->OnIncoming(message, channel);
        return 0;
    }

    void Bind(NodeImpl* node) { node_.store(node, std::memory_order_release); }
    const ZelUnicodeString& GetAdapterName() const { return name_; }

private:
    std::atomic<NodeImpl*> node_{nullptr};
    ZelUnicodeString name_;
};

}  // namespace Tarn

#endif  // TARN_SRC_HOSTING_NODEADAPTER_H_
