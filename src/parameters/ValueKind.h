// The 27 value kinds of a property, their type names, and the rules that classify type names and
// convert a double into each numeric kind.
#ifndef TARN_SRC_PARAMETERS_VALUEKIND_H_
#define TARN_SRC_PARAMETERS_VALUEKIND_H_

#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>

#include "ZelUnicodeString.h"

namespace Tarn {

// Numbered as the kind tables are ordered: properties are enumerated and encoded in this order.
enum class ValueKind {
    None = 0,
    String = 1,
    Bool,
    Int8,
    Uint8,
    Int16,
    Uint16,
    Int32,
    Uint32,
    Int64,
    Uint64,
    Float,
    Double,
    Buffer,
    Object,
    StringArray,
    BoolArray,
    Int8Array,
    Uint8Array,
    Int16Array,
    Uint16Array,
    Int32Array,
    Uint32Array,
    Int64Array,
    Uint64Array,
    FloatArray,
    DoubleArray,
    ObjectArray,
};

constexpr int kKindCount = 27;

// "string" ... "objectArray"; "" for ValueKind::None.
const char* KindName(ValueKind kind);
// The kind whose type name is exactly `typeName`, or ValueKind::None.
ValueKind KindOfTypeName(const ZelUnicodeString& typeName);

constexpr bool IsScalarKind(ValueKind k) { return k >= ValueKind::String && k <= ValueKind::Buffer; }
constexpr bool IsNumericKind(ValueKind k) { return k >= ValueKind::Int8 && k <= ValueKind::Double; }
constexpr bool IsSimpleArrayKind(ValueKind k) {
    return k >= ValueKind::StringArray && k <= ValueKind::DoubleArray;
}
constexpr bool IsNumericArrayKind(ValueKind k) {
    return k >= ValueKind::Int8Array && k <= ValueKind::DoubleArray;
}
constexpr bool IsArrayKind(ValueKind k) {
    return k >= ValueKind::StringArray && k <= ValueKind::ObjectArray;
}
// The element kind of a simple array kind ("int32[]" holds "int32").
constexpr ValueKind ElementKind(ValueKind arrayKind) {
    if (!IsSimpleArrayKind(arrayKind)) return ValueKind::None;
    return static_cast<ValueKind>(static_cast<int>(arrayKind) -
                                  (static_cast<int>(ValueKind::StringArray) -
                                   static_cast<int>(ValueKind::String)));
}

// A name that no kind has and that contains "[]" names an array of declared objects.
bool IsObjectArrayTypeName(const ZelUnicodeString& typeName);
// Any other name that is not a kind name is an object type name.
bool IsObjectTypeName(const ZelUnicodeString& typeName);
// The names a declaration may use without declaring a type: the simple kinds and "Parameters".
bool IsBuiltInTypeName(const ZelUnicodeString& typeName);
// The object type of the elements of an object-array type name: every "[]" removed.
ZelUnicodeString ElementTypeName(const ZelUnicodeString& objectArrayTypeName);

namespace detail {
// Truncates toward zero into I; NaN gives 0 and values outside I's range saturate, so no input
// makes the conversion undefined.
template <typename I>
I TruncateSaturating(double value) {
    if (std::isnan(value)) return 0;
    if (value <= static_cast<double>(std::numeric_limits<I>::min())) {
        return std::numeric_limits<I>::min();
    }
    // max() of a 64-bit type is not representable; compare with 2^bits-1 rounded up.
    if (value >= -static_cast<double>(std::numeric_limits<I>::min())) {
        return std::numeric_limits<I>::max();
    }
    return static_cast<I>(value);
}
}  // namespace detail

// The conversion of a double written through WriteNumber into each numeric kind.
template <typename T>
T ConvertNumber(double value);

namespace detail {
// The 8-, 16- and 32-bit kinds: truncate to a 32-bit signed integer, keep the low bits.
template <typename T>
T LowBitsOfInt32(double v) {
    using Unsigned = std::make_unsigned_t<T>;
    return static_cast<T>(static_cast<Unsigned>(static_cast<std::uint32_t>(TruncateSaturating<int32_t>(v))));
}
}  // namespace detail

template <>
inline signed char ConvertNumber<signed char>(double v) {
    return detail::LowBitsOfInt32<signed char>(v);
}
template <>
inline unsigned char ConvertNumber<unsigned char>(double v) {
    return detail::LowBitsOfInt32<unsigned char>(v);
}
template <>
inline short ConvertNumber<short>(double v) {
    return detail::LowBitsOfInt32<short>(v);
}
template <>
inline unsigned short ConvertNumber<unsigned short>(double v) {
    return detail::LowBitsOfInt32<unsigned short>(v);
}
template <>
inline int ConvertNumber<int>(double v) {
    return detail::LowBitsOfInt32<int>(v);
}
template <>
inline unsigned int ConvertNumber<unsigned int>(double v) {
    return static_cast<unsigned int>(static_cast<std::uint64_t>(detail::TruncateSaturating<int64_t>(v)));
}
template <>
inline long long ConvertNumber<long long>(double v) {
    return detail::TruncateSaturating<int64_t>(v);
}
template <>
inline unsigned long long ConvertNumber<unsigned long long>(double v) {
    constexpr double kTwo63 = 9223372036854775808.0;
    if (v < kTwo63) return static_cast<std::uint64_t>(detail::TruncateSaturating<int64_t>(v));
    return static_cast<std::uint64_t>(detail::TruncateSaturating<int64_t>(v - kTwo63)) +
           (std::uint64_t{1} << 63);
}
template <>
inline float ConvertNumber<float>(double v) {
    if (std::isfinite(v) && std::fabs(v) > static_cast<double>(std::numeric_limits<float>::max())) {
        // Beyond the largest float, round-to-nearest gives the largest float or infinity; keep the
        // conversion defined by deciding here.
        const double limit = static_cast<double>(std::numeric_limits<float>::max());
        const double halfUlp = std::ldexp(1.0, 127 - 24);
        if (std::fabs(v) < limit + halfUlp) return v > 0 ? std::numeric_limits<float>::max()
                                                         : -std::numeric_limits<float>::max();
        return v > 0 ? std::numeric_limits<float>::infinity()
                     : -std::numeric_limits<float>::infinity();
    }
    return static_cast<float>(v);
}
template <>
inline double ConvertNumber<double>(double v) {
    return v;
}

}  // namespace Tarn

#endif  // TARN_SRC_PARAMETERS_VALUEKIND_H_
