// Nimbo::Node: a named node of the kernel. (Placeholder until the messaging kernel lands.)
#ifndef NIMBO_NODE_H_
#define NIMBO_NODE_H_

#include "ZelUnicodeString.h"

namespace Nimbo {

class Node {
public:
    explicit Node(const ZelUnicodeString& name) : name_(name) {}
    virtual ~Node() = default;
    const ZelUnicodeString& GetName() const { return name_; }

private:
    ZelUnicodeString name_;
};

}  // namespace Nimbo

#endif  // NIMBO_NODE_H_
