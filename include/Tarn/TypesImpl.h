// Tarn::TypesImpl: the type registry behind a Types handle.
//
// It maps object type names to the pair of functions that turn a typed application object into a
// Parameters of that object type and back, publishes the library's error texts and monitor lines
// through the kernel, and owns the declarative context read from the deployment.
//
// DeclareType, Serialize and Unserialize are inline: a command module built apart from the library
// registers and converts its types with them directly on the tables. The tables are guarded by a
// reader-writer lock, so types declared on demand while other threads convert objects are safe;
// the conversion functions themselves run without the lock held.
#ifndef TARN_TYPESIMPL_H_
#define TARN_TYPESIMPL_H_

#include <map>
#include <mutex>
#include <shared_mutex>

#include "Nimbo/ResultCodes.h"
#include "Tarn/Export.h"
#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"

namespace Nimbo {
class Context;
class Node;
}  // namespace Nimbo

namespace Tarn {

class DeclarativeContext;
class Types;

// Fills `target`, an empty bag whose object type is already the type name, from `object`.
// Returns a negative result on failure; never takes ownership of `object`.
using SerializeFunction = long (*)(Parameters& target, const void* object);
// Returns a new object built from `source`, owned by the caller, or null on failure.
using UnserializeFunction = void* (*)(const Parameters& source);

class TARN_EXPORT TypesImpl {
public:
    explicit TypesImpl(const Nimbo::Context& context);
    ~TypesImpl();
    TypesImpl(const TypesImpl&) = delete;
    TypesImpl& operator=(const TypesImpl&) = delete;

    // Builds the declarative context for `types` (which must hold this registry) when there is
    // none yet; an existing one stays.
    void CreateDeclarativeContext(Types& types);
    DeclarativeContext* GetDeclarativeContext() const { return declarativeContext_; }

    // Empties `parameters`: every property removed, object type back to "Parameters".
    void ClearParameters(Parameters& parameters) const;

    // Publishes `message` through the kernel with the source "TarnCommandBinder".
    void PublishError(const ZelUnicodeString& message) const;
    // Hands one command life-cycle line to the kernel's monitor.
    void Monitor(Nimbo::Node& node, const ZelUnicodeString& text, long code) const;

    const Nimbo::Context& GetContext() const { return context_; }

    long DeclareType(const ZelUnicodeString& name, SerializeFunction serialize,
                     UnserializeFunction unserialize) {
        bool declared = false;
        if (serialize != nullptr && unserialize != nullptr) {
            std::unique_lock<std::shared_mutex> hold(tablesLock_);
            if (serializers_.count(name) == 0 && unserializers_.count(name) == 0) {
                serializers_.emplace(name, serialize);
                unserializers_.emplace(name, unserialize);
                declared = true;
            }
        }
        if (declared) return S_OK;
        PublishError("Tarn::Type::DeclareType(), Parameters Type <" + name +
                     "> already registered");
        return E_FAIL;
    }

    long Serialize(const void* object, const ZelUnicodeString& typeName,
                   Parameters& target) const {
        SerializeFunction serialize = nullptr;
        {
            std::shared_lock<std::shared_mutex> hold(tablesLock_);
            auto found = serializers_.find(typeName);
            if (found != serializers_.end()) serialize = found->second;
        }
        if (serialize == nullptr) {
            PublishError("Tarn::Type::Serialize(), Parameters Type <" + typeName +
                         "> not registered");
            return E_FAIL;
        }
        return serialize(target, object);
    }

    void* Unserialize(const Parameters& source, const ZelUnicodeString& typeName) const {
        // An element of an object array may carry the type "objectArray of <element type>".
        ZelUnicodeString type = source.GetObjectType();
        if (type.SearchSubString("objectArray", 0, ZelUnicodeString::kForward) == 0) {
            type = type.SubString(15);
        }
        if (type != typeName) {
            PublishError("Tarn::Type::Unserialize() failed, trying to unserialize type <" + type +
                         "> as type <" + typeName + ">");
            return nullptr;
        }
        UnserializeFunction unserialize = nullptr;
        {
            std::shared_lock<std::shared_mutex> hold(tablesLock_);
            auto found = unserializers_.find(typeName);
            if (found != unserializers_.end()) unserialize = found->second;
        }
        if (unserialize == nullptr) {
            PublishError("Tarn::Type::Unserialize(), Parameters Type <" + typeName +
                         "> not registered");
            return nullptr;
        }
        return unserialize(source);
    }

    // True when `name` is a declared object type.
    bool IsDeclared(const ZelUnicodeString& name) const {
        std::shared_lock<std::shared_mutex> hold(tablesLock_);
        return serializers_.count(name) != 0;
    }

private:
    const Nimbo::Context& context_;
    DeclarativeContext* declarativeContext_ = nullptr;
    std::map<ZelUnicodeString, SerializeFunction> serializers_;
    std::map<ZelUnicodeString, UnserializeFunction> unserializers_;
    mutable std::shared_mutex tablesLock_;
};

}  // namespace Tarn

#endif  // TARN_TYPESIMPL_H_
