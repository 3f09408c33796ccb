// Nested bags and typed application objects inside a bag.
#include "Tarn/TypesImpl.h"
#include "declarations/Consistency.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {

long Parameters::DeclareAsObject(const ZelUnicodeString& typeName) {
    if (typeName == "Parameters") {
        impl_->objectType = typeName;
        return S_OK;
    }
    long result = CheckConsistency(*this, typeName, "Parameters::DeclareAsObject()");
    if (result < 0) return result;
    impl_->objectType = typeName;
    return result;
}

void Parameters::DeclareAsParameters() { DeclareAsObject("Parameters"); }

long Parameters::WriteParameters(const ZelUnicodeString& name, const Parameters& value) {
    if (value.GetObjectType() != "Parameters") {
        // The check may link `value` to the defaults of its type; that link is not copied.
        long result = CheckConsistency(const_cast<Parameters&>(value), value.GetObjectType(),
                                       "Parameters::WriteParameters(" + name + ")");
        if (result < 0) return E_FAIL;
    }
    impl_->objects.insert_or_assign(name, std::make_unique<Parameters>(value));
    return S_OK;
}

namespace {

// The nested bag `name` in this bag or, when absent, along the defaults chain.
const Parameters* FindObjectInChain(const ParametersImpl& impl, const ZelUnicodeString& name) {
    for (const ParametersImpl* p = &impl; p != nullptr;
         p = p->defaults != nullptr ? &ParametersInternal::Impl(*p->defaults) : nullptr) {
        if (const Parameters* found = p->FindObject(name)) return found;
    }
    return nullptr;
}

}  // namespace

long Parameters::ReadParameters(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                                Parameters& out) const {
    const Parameters* stored = FindObjectInChain(*impl_, name);
    if (stored != nullptr) {
        if (stored->GetObjectType() == typeName) {
            out.impl_->CopyFrom(*stored->impl_);
            return S_OK;
        }
        impl_->PublishError("Parameters::ReadParameters(), invalid type for property <" + name +
                            "> type <" + stored->GetObjectType() + "> asked type <" + typeName +
                            ">");
    }
    impl_->PublishError("Parameters::ReadPropertyAsParameters(), property not found <" + name +
                        ">");
    return E_FAIL;
}

long Parameters::ReadParameters(const ZelUnicodeString& name, Parameters*& out) const {
    void* object = nullptr;
    long result = ReadObject(name, "Parameters", object);
    out = static_cast<Parameters*>(object);
    return result;
}

long Parameters::WriteObject(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                             const void* object) {
    std::unique_ptr<Parameters>& slot = impl_->objects[name];
    slot.reset(impl_->NewParameters(typeName));
    if (impl_->types->Serialize(object, typeName, *slot) >= 0) return S_OK;
    impl_->PublishError("Parameters::WriteObject() serialization fail, property <" + name +
                        "> type <" + typeName + ">");
    return E_FAIL;
}

long Parameters::WriteObjectArray(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                                  const std::vector<const void*>& objects) {
    if (objects.empty()) {
        impl_->elementTypes.insert_or_assign(name, typeName);
    } else {
        impl_->elementTypes.erase(name);
    }
    ObjectArray& array = impl_->objectArrays[name];
    array.Clear();
    array.elements.reserve(objects.size());
    bool failed = false;
    for (const void* object : objects) {
        Parameters* element = impl_->NewParameters(typeName);
        array.elements.push_back(element);
        if (impl_->types->Serialize(object, typeName, *element) < 0) failed = true;
    }
    if (!failed) return S_OK;
    impl_->PublishError("Parameters::WriteObjectArray() serialization fail, property <" + name +
                        "> type <" + typeName + ">");
    return E_FAIL;
}

long Parameters::ReadObject(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                            void*& object) const {
    object = nullptr;
    const Parameters* stored = FindObjectInChain(*impl_, name);
    if (stored == nullptr) {
        impl_->PublishError("Parameters::ReadObject() unknown property <" + name + ">");
        return E_FAIL;
    }
    if (stored->GetObjectType() != typeName) {
        impl_->PublishError("Parameters::ReadObject() property <" + name + "> invalid type <" +
                            typeName + "> expected type <" + stored->GetObjectType() + ">");
        return E_FAIL;
    }
    object = impl_->types->Unserialize(*stored, typeName);
    if (object != nullptr) return S_OK;
    impl_->PublishError("Unserialize Error in Parameters::ReadObject() property <" + name +
                        "> type <" + typeName + ">");
    return E_FAIL;
}

}  // namespace Tarn
