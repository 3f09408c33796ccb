// Tarn::Types: the handle on a type registry (TypesImpl), which every Parameters is bound to.
//
// A Types owns its TypesImpl. There is one registry per Commands object; modules reach it through
// GetImpl() to declare their object types. After construction the registry's tables are only
// read, and reading them is safe from several threads; see TypesImpl for declarations made later.
#ifndef TARN_TYPES_H_
#define TARN_TYPES_H_

#include "Tarn/Export.h"

namespace Nimbo {
class Context;
}

namespace Tarn {

class DeclarativeContext;
class Parameters;
class TypesImpl;

class TARN_EXPORT Types {
public:
    explicit Types(const Nimbo::Context& context);
    ~Types();
    Types(const Types&) = delete;
    Types& operator=(const Types&) = delete;

    // A new, empty bag bound to this registry, of object type "Parameters".
    Parameters CreateParameters() const;
    // The declarations read from the deployment, or null when there are none.
    DeclarativeContext* GetDeclarativeContext() const;
    TypesImpl& GetImpl() const { return *impl_; }

private:
    TypesImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_TYPES_H_
