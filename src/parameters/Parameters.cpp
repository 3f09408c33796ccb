#include "Tarn/Parameters.h"

#include <cstring>
#include <type_traits>

#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

// Reads `name` from the table of one kind: this bag first, then the linked defaults (their own
// table only).
template <typename T, typename Out>
long ReadFromTable(const ParametersImpl& impl, const Table<T>& (*table)(const ParametersImpl&),
                   const ZelUnicodeString& name, Out& out, const char* literal) {
    const Table<T>& own = table(impl);
    auto found = own.find(name);
    if (found != own.end()) {
        out = found->second;
        return S_OK;
    }
    if (impl.defaults != nullptr) {
        const Table<T>& linked = table(ParametersInternal::Impl(*impl.defaults));
        auto fallback = linked.find(name);
        if (fallback != linked.end()) {
            out = fallback->second;
            return S_OK;
        }
    }
    impl.PublishError(literal + name + ">");
    return E_FAIL;
}

// Stores `count` elements from `values`, refusing a null pointer with a non-zero count.
template <typename T, typename In>
long WriteArrayFrom(ParametersImpl& impl, Table<std::vector<T>>& table,
                    const ZelUnicodeString& name, const In* values, unsigned int count,
                    const char* operation) {
    if (values == nullptr && count != 0) {
        impl.PublishError(ZelUnicodeString(operation) + " null values for property <" + name +
                          ">");
        return E_FAIL;
    }
    std::vector<T> stored;
    if constexpr (std::is_same<In, bool>::value) {
        // Callers hand over bytes; any non-zero byte is true (reading it as bool would not be).
        const auto* bytes = reinterpret_cast<const unsigned char*>(values);
        stored.reserve(count);
        for (unsigned int i = 0; i < count; ++i) stored.push_back(bytes[i] != 0);
    } else if (count != 0) {
        stored.assign(values, values + count);
    }
    table.insert_or_assign(name, std::move(stored));
    return S_OK;
}

Nimbo::Binary CopyBytes(const void* data, unsigned int size) {
    if (size == 0) return Nimbo::Binary();
    char* copy = new char[size];
    std::memcpy(copy, data, size);
    return Nimbo::Binary(copy, size, Nimbo::deallocateArrayChar);
}

template <ValueKind K>
const Table<typename KindTable<K>::Value>& TableOf(const ParametersImpl& impl) {
    return KindTable<K>::Get(impl);
}

}  // namespace

Parameters::Parameters(const Types& types)
    : impl_(new ParametersImpl(types.GetImpl(), "Parameters")) {}

Parameters::Parameters(const TypesImpl& types, const ZelUnicodeString& objectType)
    : impl_(new ParametersImpl(types, objectType)) {}

Parameters::~Parameters() { delete impl_; }

const ZelUnicodeString& Parameters::GetObjectType() const { return impl_->objectType; }

bool Parameters::Exists(const ZelUnicodeString& name) const {
    ZelUnicodeString type;
    return Exists(name, type);
}

bool Parameters::Exists(const ZelUnicodeString& name, ZelUnicodeString& type) const {
    for (const Parameters* p = this; p != nullptr; p = p->impl_->defaults) {
        if (p->impl_->GetPropertyType(name, type)) return true;
    }
    return false;
}

bool Parameters::ExistsWithType(const ZelUnicodeString& name,
                                const ZelUnicodeString& typeName) const {
    for (const Parameters* p = this; p != nullptr; p = p->impl_->defaults) {
        if (p->impl_->HasPropertyWithType(name, typeName)) return true;
    }
    return false;
}

bool Parameters::HasOwnTarnProperty(const ZelUnicodeString& name) const {
    ZelUnicodeString type;
    return impl_->GetPropertyType(name, type);
}

bool Parameters::hasOwnTarnProperty(const ZelUnicodeString& name) const {
    return HasOwnTarnProperty(name);
}

bool Parameters::HasOwnTarnProperty(const ZelUnicodeString& name, ZelUnicodeString& type) const {
    return impl_->GetPropertyType(name, type);
}

bool Parameters::HasOwnTarnPropertyWithType(const ZelUnicodeString& name,
                                            const ZelUnicodeString& typeName) const {
    return impl_->HasPropertyWithType(name, typeName);
}

bool Parameters::RemoveProperty(const ZelUnicodeString& name) {
    return impl_->RemoveProperty(name);
}

bool Parameters::IsEmpty() const { return impl_->IsEmpty(); }

// --- Scalar writers and readers ----------------------------------------------------------------

#define TARN_SCALAR_ACCESSORS(KIND, TYPE, MEMBER)                                         \
    long Parameters::Write##KIND(const ZelUnicodeString& name, TYPE value) {              \
        impl_->MEMBER.insert_or_assign(name, value);                                      \
        return S_OK;                                                                      \
    }                                                                                     \
    long Parameters::Read##KIND(const ZelUnicodeString& name, TYPE& value) const {        \
        return ReadFromTable(*impl_, &TableOf<ValueKind::KIND>, name, value,              \
                             "Parameters::Read" #KIND "() unknown property <");           \
    }

TARN_SCALAR_ACCESSORS(Bool, bool, bools)
TARN_SCALAR_ACCESSORS(Int8, signed char, int8s)
TARN_SCALAR_ACCESSORS(Uint8, unsigned char, uint8s)
TARN_SCALAR_ACCESSORS(Int16, short, int16s)
TARN_SCALAR_ACCESSORS(Uint16, unsigned short, uint16s)
TARN_SCALAR_ACCESSORS(Int32, int, int32s)
TARN_SCALAR_ACCESSORS(Uint32, unsigned int, uint32s)
TARN_SCALAR_ACCESSORS(Int64, long long, int64s)
TARN_SCALAR_ACCESSORS(Uint64, unsigned long long, uint64s)
TARN_SCALAR_ACCESSORS(Float, float, floats)
TARN_SCALAR_ACCESSORS(Double, double, doubles)
#undef TARN_SCALAR_ACCESSORS

long Parameters::WriteString(const ZelUnicodeString& name, const ZelUnicodeString& value) {
    impl_->strings.insert_or_assign(name, value);
    return S_OK;
}

long Parameters::ReadString(const ZelUnicodeString& name, ZelUnicodeString& value) const {
    return ReadFromTable(*impl_, &TableOf<ValueKind::String>, name, value,
                         "Parameters::ReadString() unknown property <");
}

// --- Buffers -----------------------------------------------------------------------------------

long Parameters::WriteBuffer(const ZelUnicodeString& name, const void* data, unsigned int size) {
    if (data == nullptr && size != 0) {
        impl_->PublishError("Parameters::WriteBuffer() null data for property <" + name + ">");
        return E_FAIL;
    }
    impl_->buffers.insert_or_assign(name, CopyBytes(data, size));
    return S_OK;
}

long Parameters::WriteBuffer(const ZelUnicodeString& name, const Nimbo::Binary& value) {
    return WriteBuffer(name, value.GetData(), value.GetSize());
}

long Parameters::ReadBuffer(const ZelUnicodeString& name, const void*& data,
                            unsigned int& size) const {
    Nimbo::Binary found;
    long result = ReadFromTable(*impl_, &TableOf<ValueKind::Buffer>, name, found,
                                "Parameters::ReadBuffer() unknown property <");
    if (result < 0) return result;
    // `found` shares the stored block, so the address stays valid after it goes.
    data = found.GetData();
    size = found.GetSize();
    return S_OK;
}

// --- Arrays ------------------------------------------------------------------------------------

#define TARN_ARRAY_ACCESSORS(KIND, TYPE, MEMBER, LITERAL)                                      \
    long Parameters::Write##KIND##Array(const ZelUnicodeString& name,                          \
                                        const std::vector<TYPE>& values) {                     \
        impl_->MEMBER.insert_or_assign(name, values);                                          \
        return S_OK;                                                                           \
    }                                                                                          \
    long Parameters::Write##KIND##Array(const ZelUnicodeString& name, TYPE* values,            \
                                        unsigned int count) {                                  \
        return WriteArrayFrom(*impl_, impl_->MEMBER, name, values, count,                      \
                              "Parameters::Write" #KIND "Array()");                            \
    }                                                                                          \
    long Parameters::Read##KIND##Array(const ZelUnicodeString& name,                           \
                                       std::vector<TYPE>& values) const {                      \
        return ReadFromTable(*impl_, &TableOf<ValueKind::KIND##Array>, name, values, LITERAL); \
    }

// The blanks inside some literals pad every text to one length; callers match them exactly.
TARN_ARRAY_ACCESSORS(String, ZelUnicodeString, stringArrays,
                     "Parameters::ReadStringArray() unknown property <")
TARN_ARRAY_ACCESSORS(Bool, bool, boolArrays, "Parameters::ReadBoolArray  () unknown property <")
TARN_ARRAY_ACCESSORS(Int8, signed char, int8Arrays,
                     "Parameters::ReadInt8Array  () unknown property <")
TARN_ARRAY_ACCESSORS(Uint8, unsigned char, uint8Arrays,
                     "Parameters::ReadUint8Array () unknown property <")
TARN_ARRAY_ACCESSORS(Int16, short, int16Arrays,
                     "Parameters::ReadInt16Array () unknown property <")
TARN_ARRAY_ACCESSORS(Uint16, unsigned short, uint16Arrays,
                     "Parameters::ReadUint16Array() unknown property <")
TARN_ARRAY_ACCESSORS(Int32, int, int32Arrays, "Parameters::ReadInt32Array () unknown property <")
TARN_ARRAY_ACCESSORS(Uint32, unsigned int, uint32Arrays,
                     "Parameters::ReadUint32Array() unknown property <")
TARN_ARRAY_ACCESSORS(Int64, long long, int64Arrays,
                     "Parameters::ReadInt64Array () unknown property <")
TARN_ARRAY_ACCESSORS(Uint64, unsigned long long, uint64Arrays,
                     "Parameters::ReadUint64Array() unknown property <")
TARN_ARRAY_ACCESSORS(Float, float, floatArrays,
                     "Parameters::ReadFloatArray () unknown property <")
TARN_ARRAY_ACCESSORS(Double, double, doubleArrays,
                     "Parameters::ReadDoubleArray() unknown property <")
#undef TARN_ARRAY_ACCESSORS

}  // namespace Tarn
