#include "parameters/ParametersImpl.h"

#include "Tarn/TypesImpl.h"

namespace Tarn {

void ObjectArray::Clear() {
    for (Parameters* element : elements) delete element;
    elements.clear();
}

void ParametersImpl::Clear() {
    objectType = "Parameters";
    ForEachTable([](auto, auto& table) { table.clear(); });
    elementTypes.clear();
}

bool ParametersImpl::IsEmpty() const {
    bool empty = elementTypes.empty();
    ForEachTable([&empty](auto, const auto& table) { empty = empty && table.empty(); });
    return empty;
}

long ParametersImpl::GetObjectArrayElementType(const ZelUnicodeString& name,
                                               ZelUnicodeString& type) const {
    auto found = objectArrays.find(name);
    if (found != objectArrays.end()) {
        const std::vector<Parameters*>& elements = found->second.elements;
        if (!elements.empty()) {
            if (elements.front() != nullptr) {
                type = elements.front()->GetObjectType();
                return S_OK;
            }
        } else {
            auto recorded = elementTypes.find(name);
            if (recorded != elementTypes.end()) {
                type = recorded->second;
                return S_OK;
            }
        }
    }
    type = "";
    return E_FAIL;
}

bool ParametersImpl::GetPropertyType(const ZelUnicodeString& name, ZelUnicodeString& type) const {
    // Simple kinds in kind order, then nested objects, then object arrays.
    bool found = false;
    ForEachTable([&](auto kind, const auto& table) {
        constexpr ValueKind k = decltype(kind)::value;
        if (found || k == ValueKind::Object || k == ValueKind::ObjectArray) return;
        if (table.count(name) != 0) {
            type = KindName(k);
            found = true;
        }
    });
    if (found) return true;
    auto object = objects.find(name);
    if (object != objects.end()) {
        type = object->second->GetObjectType();
        return true;
    }
    ZelUnicodeString element;
    if (GetObjectArrayElementType(name, element) >= 0) {
        type = element + "[]";
        return true;
    }
    return false;
}

bool ParametersImpl::HasPropertyWithType(const ZelUnicodeString& name,
                                         const ZelUnicodeString& typeName) const {
    ValueKind wanted = KindOfTypeName(typeName);
    if (wanted != ValueKind::None) {
        bool found = false;
        ForEachTable([&](auto kind, const auto& table) {
            if (decltype(kind)::value == wanted) found = table.count(name) != 0;
        });
        return found;
    }
    if (typeName.SearchSubString("[]") >= 0) {
        ZelUnicodeString element;
        return GetObjectArrayElementType(name, element) >= 0 && element + "[]" == typeName;
    }
    auto object = objects.find(name);
    return object != objects.end() && object->second->GetObjectType() == typeName;
}

bool ParametersImpl::RemoveProperty(const ZelUnicodeString& name) {
    bool removed = false;
    ForEachTable([&](auto, auto& table) { removed = table.erase(name) != 0 || removed; });
    // The record only describes an object array of that name; none is left.
    elementTypes.erase(name);
    return removed;
}

Parameters* ParametersImpl::FindObject(const ZelUnicodeString& name) const {
    auto found = objects.find(name);
    return found != objects.end() ? found->second.get() : nullptr;
}

Parameters* ParametersImpl::GetOrCreateObject(const ZelUnicodeString& name) {
    std::unique_ptr<Parameters>& slot = objects[name];
    if (!slot) slot.reset(NewParameters("Parameters"));
    return slot.get();
}

std::vector<Parameters*>* ParametersImpl::GetOrCreateObjectArray(
    const ZelUnicodeString& name, const ZelUnicodeString& elementType) {
    if (!elementType.IsEmpty()) elementTypes.emplace(name, elementType);
    return &objectArrays[name].elements;
}

long ParametersImpl::RemoveObject(const ZelUnicodeString& name) {
    return objects.erase(name) != 0 ? S_OK : E_FAIL;
}

bool ParametersImpl::RemoveUint8(const ZelUnicodeString& name) { return uint8s.erase(name) != 0; }

long ParametersImpl::WriteNumber(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                                 double value) {
    ValueKind kind = KindOfTypeName(typeName);
    if (!IsNumericKind(kind)) return E_FAIL;
    ForEachTable([&](auto k, auto& table) {
        constexpr ValueKind current = decltype(k)::value;
        if constexpr (IsNumericKind(current)) {
            using T = typename std::decay_t<decltype(table)>::mapped_type;
            if (current == kind) table.insert_or_assign(name, ConvertNumber<T>(value));
        }
    });
    return S_OK;
}

long ParametersImpl::WriteNumberArray(const ZelUnicodeString& name,
                                      const ZelUnicodeString& arrayTypeName,
                                      const std::vector<double>& values) {
    ValueKind kind = KindOfTypeName(arrayTypeName);
    if (!IsNumericArrayKind(kind)) return E_FAIL;
    ForEachTable([&](auto k, auto& table) {
        constexpr ValueKind current = decltype(k)::value;
        if constexpr (IsNumericArrayKind(current)) {
            using T = typename std::decay_t<decltype(table)>::mapped_type::value_type;
            if (current != kind) return;
            std::vector<T> converted;
            converted.reserve(values.size());
            for (double v : values) converted.push_back(ConvertNumber<T>(v));
            table.insert_or_assign(name, std::move(converted));
        }
    });
    return S_OK;
}

long ParametersImpl::CompareWithDefaults(
    const Parameters& defaults,
    std::vector<std::pair<ZelUnicodeString, ZelUnicodeString>>& unknown,
    std::vector<std::pair<ZelUnicodeString, std::pair<ZelUnicodeString, ZelUnicodeString>>>&
        wrongType) const {
    const ParametersImpl& other = ParametersInternal::Impl(defaults);
    bool compatible = true;
    ForEachTable([&](auto k, const auto& table) {
        constexpr ValueKind kind = decltype(k)::value;
        const auto& otherTable = KindTable<kind>::Get(other);
        for (const auto& entry : table) {
            if (otherTable.count(entry.first) != 0) continue;
            compatible = false;
            ZelUnicodeString received;
            if constexpr (kind == ValueKind::Object) {
                received = entry.second->GetObjectType();
            } else if constexpr (kind == ValueKind::ObjectArray) {
                // An empty array has no first element; its recorded element type stands in.
                if (!entry.second.elements.empty() && entry.second.elements.front() != nullptr) {
                    received = entry.second.elements.front()->GetObjectType();
                } else {
                    GetObjectArrayElementType(entry.first, received);
                }
            } else {
                received = KindName(kind);
            }
            ZelUnicodeString expected;
            if (other.GetPropertyType(entry.first, expected)) {
                wrongType.emplace_back(entry.first, std::make_pair(received, expected));
            } else {
                unknown.emplace_back(entry.first, received);
            }
        }
    });
    return compatible ? S_OK : E_FAIL;
}

Parameters* ParametersImpl::NewParameters(const ZelUnicodeString& objectType) const {
    return ParametersInternal::New(*types, objectType);
}

void ParametersImpl::PublishError(const ZelUnicodeString& message) const {
    types->PublishError(message);
}

}  // namespace Tarn
