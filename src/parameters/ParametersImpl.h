// ParametersImpl: the storage behind a Parameters handle.
//
// One ordered table per value kind, keyed by property name; the tables are independent, so one
// name may live in several of them. Nested bags and object-array elements are owned here. The
// registry pointer and the defaults link are not owned.
#ifndef TARN_SRC_PARAMETERS_PARAMETERSIMPL_H_
#define TARN_SRC_PARAMETERS_PARAMETERSIMPL_H_

#include <map>
#include <memory>
#include <type_traits>
#include <utility>
#include <vector>

#include "Nimbo/Binary.h"
#include "Tarn/Parameters.h"
#include "ZelUnicodeString.h"
#include "parameters/ValueKind.h"

namespace Tarn {

class TypesImpl;

// The elements of an object-array property; each element is owned. A slot may hold null when a
// caller appended one; every reader treats such a slot as absent.
class ObjectArray {
public:
    ObjectArray() = default;
    ObjectArray(ObjectArray&& other) noexcept : elements(std::move(other.elements)) {}
    ObjectArray& operator=(ObjectArray&& other) noexcept {
        if (this != &other) {
            Clear();
            elements = std::move(other.elements);
        }
        return *this;
    }
    ObjectArray(const ObjectArray&) = delete;
    ObjectArray& operator=(const ObjectArray&) = delete;
    ~ObjectArray() { Clear(); }

    void Clear();

    std::vector<Parameters*> elements;
};

template <typename T>
using Table = std::map<ZelUnicodeString, T>;

class ParametersImpl {
public:
    ParametersImpl(const TypesImpl& types, const ZelUnicodeString& objectType)
        : objectType(objectType), types(&types) {}
    ~ParametersImpl() { Clear(); }
    ParametersImpl(const ParametersImpl&) = delete;
    ParametersImpl& operator=(const ParametersImpl&) = delete;

    // Calls f(std::integral_constant<ValueKind, K>, table) for the 27 tables in kind order.
    template <typename F>
    void ForEachTable(F&& f);
    template <typename F>
    void ForEachTable(F&& f) const;

    // Removes every property and resets the object type to "Parameters"; the registry and the
    // defaults link stay.
    void Clear();
    // Makes this bag a deep copy of `source` (properties and object type); the registry and the
    // defaults link of this bag stay.
    void CopyFrom(const ParametersImpl& source);
    // Copies the properties of `source` into the empty `target`.
    static void CopyTables(const ParametersImpl& source, ParametersImpl& target);
    // Exchanges properties, element types and object types with `other`.
    void SwapContents(ParametersImpl& other);
    void SetObjectType(const ZelUnicodeString& typeName) { objectType = typeName; }
    void SetDefaults(const Parameters* link) { defaults = link; }
    const Parameters* GetDefaults() const { return defaults; }

    bool IsEmpty() const;
    // The reported type of an own property, probing the tables in lookup order.
    bool GetPropertyType(const ZelUnicodeString& name, ZelUnicodeString& type) const;
    bool HasPropertyWithType(const ZelUnicodeString& name, const ZelUnicodeString& typeName) const;
    long GetObjectArrayElementType(const ZelUnicodeString& name, ZelUnicodeString& type) const;
    bool RemoveProperty(const ZelUnicodeString& name);

    Parameters* FindObject(const ZelUnicodeString& name) const;
    Parameters* GetOrCreateObject(const ZelUnicodeString& name);
    std::vector<Parameters*>* GetOrCreateObjectArray(const ZelUnicodeString& name,
                                                     const ZelUnicodeString& elementType);
    long RemoveObject(const ZelUnicodeString& name);
    bool RemoveUint8(const ZelUnicodeString& name);

    long WriteNumber(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                     double value);
    long WriteNumberArray(const ZelUnicodeString& name, const ZelUnicodeString& arrayTypeName,
                          const std::vector<double>& values);

    // Appends (name, received type) for each property that `defaults` lacks in the same kind, and
    // (name, received type, expected type) when `defaults` holds the name under another type.
    long CompareWithDefaults(
        const Parameters& defaults,
        std::vector<std::pair<ZelUnicodeString, ZelUnicodeString>>& unknown,
        std::vector<std::pair<ZelUnicodeString, std::pair<ZelUnicodeString, ZelUnicodeString>>>&
            wrongType) const;

    // A new empty bag bound to this registry, owned by the caller.
    Parameters* NewParameters(const ZelUnicodeString& objectType) const;

    // Publishes through this bag's registry.
    void PublishError(const ZelUnicodeString& message) const;

    // The kind tables, in kind order.
    Table<ZelUnicodeString> strings;
    Table<bool> bools;
    Table<signed char> int8s;
    Table<unsigned char> uint8s;
    Table<short> int16s;
    Table<unsigned short> uint16s;
    Table<int> int32s;
    Table<unsigned int> uint32s;
    Table<long long> int64s;
    Table<unsigned long long> uint64s;
    Table<float> floats;
    Table<double> doubles;
    Table<Nimbo::Binary> buffers;
    Table<std::unique_ptr<Parameters>> objects;
    Table<std::vector<ZelUnicodeString>> stringArrays;
    Table<std::vector<bool>> boolArrays;
    Table<std::vector<signed char>> int8Arrays;
    Table<std::vector<unsigned char>> uint8Arrays;
    Table<std::vector<short>> int16Arrays;
    Table<std::vector<unsigned short>> uint16Arrays;
    Table<std::vector<int>> int32Arrays;
    Table<std::vector<unsigned int>> uint32Arrays;
    Table<std::vector<long long>> int64Arrays;
    Table<std::vector<unsigned long long>> uint64Arrays;
    Table<std::vector<float>> floatArrays;
    Table<std::vector<double>> doubleArrays;
    Table<ObjectArray> objectArrays;

    // Element object type of an object array, reported while its sequence is empty.
    std::map<ZelUnicodeString, ZelUnicodeString> elementTypes;
    ZelUnicodeString objectType;
    const TypesImpl* types;
    const Parameters* defaults = nullptr;
};

// KindTable<K>::Get(impl) is the table of kind K; Value is its mapped type.
template <ValueKind K>
struct KindTable;

#define TARN_KIND_TABLE(KIND, MEMBER)                                              \
    template <>                                                                    \
    struct KindTable<ValueKind::KIND> {                                            \
        using Value = decltype(ParametersImpl::MEMBER)::mapped_type;               \
        static Table<Value>& Get(ParametersImpl& impl) { return impl.MEMBER; }     \
        static const Table<Value>& Get(const ParametersImpl& impl) { return impl.MEMBER; } \
    };
TARN_KIND_TABLE(String, strings)
TARN_KIND_TABLE(Bool, bools)
TARN_KIND_TABLE(Int8, int8s)
TARN_KIND_TABLE(Uint8, uint8s)
TARN_KIND_TABLE(Int16, int16s)
TARN_KIND_TABLE(Uint16, uint16s)
TARN_KIND_TABLE(Int32, int32s)
TARN_KIND_TABLE(Uint32, uint32s)
TARN_KIND_TABLE(Int64, int64s)
TARN_KIND_TABLE(Uint64, uint64s)
TARN_KIND_TABLE(Float, floats)
TARN_KIND_TABLE(Double, doubles)
TARN_KIND_TABLE(Buffer, buffers)
TARN_KIND_TABLE(Object, objects)
TARN_KIND_TABLE(StringArray, stringArrays)
TARN_KIND_TABLE(BoolArray, boolArrays)
TARN_KIND_TABLE(Int8Array, int8Arrays)
TARN_KIND_TABLE(Uint8Array, uint8Arrays)
TARN_KIND_TABLE(Int16Array, int16Arrays)
TARN_KIND_TABLE(Uint16Array, uint16Arrays)
TARN_KIND_TABLE(Int32Array, int32Arrays)
TARN_KIND_TABLE(Uint32Array, uint32Arrays)
TARN_KIND_TABLE(Int64Array, int64Arrays)
TARN_KIND_TABLE(Uint64Array, uint64Arrays)
TARN_KIND_TABLE(FloatArray, floatArrays)
TARN_KIND_TABLE(DoubleArray, doubleArrays)
TARN_KIND_TABLE(ObjectArray, objectArrays)
#undef TARN_KIND_TABLE

namespace detail {
template <typename Impl, typename F, int... I>
void ForEachTableImpl(Impl& impl, F& f, std::integer_sequence<int, I...>) {
    (f(std::integral_constant<ValueKind, static_cast<ValueKind>(I + 1)>{},
       KindTable<static_cast<ValueKind>(I + 1)>::Get(impl)),
     ...);
}
}  // namespace detail

template <typename F>
void ParametersImpl::ForEachTable(F&& f) {
    detail::ForEachTableImpl(*this, f, std::make_integer_sequence<int, kKindCount>{});
}

template <typename F>
void ParametersImpl::ForEachTable(F&& f) const {
    detail::ForEachTableImpl(*this, f, std::make_integer_sequence<int, kKindCount>{});
}

// Library access to the private parts of a Parameters.
class ParametersInternal {
public:
    static ParametersImpl& Impl(Parameters& p) { return *p.impl_; }
    static const ParametersImpl& Impl(const Parameters& p) { return *p.impl_; }
    static Parameters* New(const TypesImpl& types, const ZelUnicodeString& objectType) {
        return new Parameters(types, objectType);
    }
    static long FromBinary(Parameters& p, const Nimbo::Binary& bytes) { return p.FromBinary(bytes); }
    // An empty plain bag bound to `types`.
    static Parameters Make(const TypesImpl& types) { return Parameters(types, "Parameters"); }
    // Stores a deep copy of `value` (keeping its object type) as the nested bag `name`.
    static void PutObject(Parameters& bag, const ZelUnicodeString& name, const Parameters& value) {
        Impl(*bag.impl_->GetOrCreateObject(name)).CopyFrom(Impl(value));
    }
};

}  // namespace Tarn

#endif  // TARN_SRC_PARAMETERS_PARAMETERSIMPL_H_
