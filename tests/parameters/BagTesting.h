// Helpers for tests that compare whole bags and make random ones.
#ifndef TARN_TESTS_PARAMETERS_BAGTESTING_H_
#define TARN_TESTS_PARAMETERS_BAGTESTING_H_

#include <cstring>
#include <random>
#include <string>

#include "Tarn/Parameters.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace Testing {

// Same properties in the same kinds with the same values (bitwise for floating point), same
// object types, same element types of empty object arrays. Describes the first difference.
inline bool SameBag(const Parameters& a, const Parameters& b, std::string* why = nullptr);

namespace detail {

template <typename T>
bool SameValue(const T& x, const T& y) {
    return x == y;
}
inline bool SameValue(const float& x, const float& y) { return std::memcmp(&x, &y, sizeof x) == 0; }
inline bool SameValue(const double& x, const double& y) {
    return std::memcmp(&x, &y, sizeof x) == 0;
}
template <typename T>
bool SameValue(const std::vector<T>& x, const std::vector<T>& y) {
    if (x.size() != y.size()) return false;
    for (std::size_t i = 0; i < x.size(); ++i) {
        if (!SameValue(static_cast<T>(x[i]), static_cast<T>(y[i]))) return false;
    }
    return true;
}
inline bool SameValue(const std::unique_ptr<Parameters>& x, const std::unique_ptr<Parameters>& y) {
    return SameBag(*x, *y);
}
inline bool SameValue(const ObjectArray& x, const ObjectArray& y) {
    if (x.elements.size() != y.elements.size()) return false;
    for (std::size_t i = 0; i < x.elements.size(); ++i) {
        if ((x.elements[i] == nullptr) != (y.elements[i] == nullptr)) return false;
        if (x.elements[i] != nullptr && !SameBag(*x.elements[i], *y.elements[i])) return false;
    }
    return true;
}

}  // namespace detail

inline bool SameBag(const Parameters& a, const Parameters& b, std::string* why) {
    const ParametersImpl& x = ParametersInternal::Impl(a);
    const ParametersImpl& y = ParametersInternal::Impl(b);
    std::string reason;
    if (x.objectType != y.objectType) {
        reason = "object type " + x.objectType.str() + " vs " + y.objectType.str();
    }
    x.ForEachTable([&](auto k, const auto& table) {
        if (!reason.empty()) return;
        const auto& other = KindTable<decltype(k)::value>::Get(y);
        if (table.size() != other.size()) {
            reason = std::string("count of kind ") + KindName(decltype(k)::value);
            return;
        }
        for (auto i = table.begin(), j = other.begin(); i != table.end(); ++i, ++j) {
            if (i->first != j->first || !detail::SameValue(i->second, j->second)) {
                reason = std::string("property ") + i->first.str() + " of kind " +
                         KindName(decltype(k)::value);
                return;
            }
        }
    });
    if (reason.empty()) {
        for (const auto& array : x.objectArrays) {
            if (!array.second.elements.empty()) continue;
            ZelUnicodeString tx, ty;
            x.GetObjectArrayElementType(array.first, tx);
            y.GetObjectArrayElementType(array.first, ty);
            if (tx != ty) reason = "element type of " + array.first.str();
        }
    }
    if (why != nullptr) *why = reason;
    return reason.empty();
}

// A random bag: every kind may appear, names are shared across kinds, nesting up to `depth`.
class BagGenerator {
public:
    explicit BagGenerator(unsigned int seed) : random_(seed) {}

    void Fill(Parameters& bag, int depth) {
        int count = Pick(0, 12);
        for (int i = 0; i < count; ++i) AddOne(bag, depth);
        if (Pick(0, 3) == 0) ParametersInternal::Impl(bag).SetObjectType(Name());
    }

private:
    int Pick(int low, int high) { return std::uniform_int_distribution<int>(low, high)(random_); }
    ZelUnicodeString Name() {
        static const char* const kNames[] = {"a", "b", "name", "x y", "\xC3\xA9t\xC3\xA9",
                                             "quote\"d", "long_property_name_here", ""};
        return kNames[Pick(0, 7)];
    }
    ZelUnicodeString Text() {
        std::string text;
        int length = Pick(0, 20);
        for (int i = 0; i < length; ++i) text += static_cast<char>(Pick(1, 255));
        return text;
    }
    template <typename T>
    T Number() {
        unsigned long long bits = random_();
        T value;
        std::memcpy(&value, &bits, sizeof value);
        return value;
    }
    template <typename T>
    std::vector<T> Numbers() {
        std::vector<T> values(static_cast<std::size_t>(Pick(0, 6)));
        for (T& v : values) v = Number<T>();
        return values;
    }

    void AddOne(Parameters& bag, int depth) {
        ZelUnicodeString name = Name();
        switch (Pick(0, depth > 0 ? 26 : 24)) {
            case 0: bag.WriteString(name, Text()); break;
            case 1: bag.WriteBool(name, Pick(0, 1) == 1); break;
            case 2: bag.WriteInt8(name, Number<signed char>()); break;
            case 3: bag.WriteUint8(name, Number<unsigned char>()); break;
            case 4: bag.WriteInt16(name, Number<short>()); break;
            case 5: bag.WriteUint16(name, Number<unsigned short>()); break;
            case 6: bag.WriteInt32(name, Number<int>()); break;
            case 7: bag.WriteUint32(name, Number<unsigned int>()); break;
            case 8: bag.WriteInt64(name, Number<long long>()); break;
            case 9: bag.WriteUint64(name, Number<unsigned long long>()); break;
            case 10: bag.WriteFloat(name, Number<float>()); break;
            case 11: bag.WriteDouble(name, Number<double>()); break;
            case 12: {
                std::vector<unsigned char> bytes = Numbers<unsigned char>();
                bag.WriteBuffer(name, bytes.data(), static_cast<unsigned int>(bytes.size()));
                break;
            }
            case 13: {
                std::vector<ZelUnicodeString> texts(static_cast<std::size_t>(Pick(0, 4)));
                for (auto& t : texts) t = Text();
                bag.WriteStringArray(name, texts);
                break;
            }
            case 14: {
                std::vector<bool> bits(static_cast<std::size_t>(Pick(0, 17)));
                for (std::size_t i = 0; i < bits.size(); ++i) bits[i] = Pick(0, 1) == 1;
                bag.WriteBoolArray(name, bits);
                break;
            }
            case 15: bag.WriteInt8Array(name, Numbers<signed char>()); break;
            case 16: bag.WriteUint8Array(name, Numbers<unsigned char>()); break;
            case 17: bag.WriteInt16Array(name, Numbers<short>()); break;
            case 18: bag.WriteUint16Array(name, Numbers<unsigned short>()); break;
            case 19: bag.WriteInt32Array(name, Numbers<int>()); break;
            case 20: bag.WriteUint32Array(name, Numbers<unsigned int>()); break;
            case 21: bag.WriteInt64Array(name, Numbers<long long>()); break;
            case 22: bag.WriteUint64Array(name, Numbers<unsigned long long>()); break;
            case 23: bag.WriteFloatArray(name, Numbers<float>()); break;
            case 24: bag.WriteDoubleArray(name, Numbers<double>()); break;
            case 25: {
                ParametersImpl& impl = ParametersInternal::Impl(bag);
                Parameters* nested = impl.GetOrCreateObject(name);
                ParametersInternal::Impl(*nested).Clear();
                Fill(*nested, depth - 1);
                break;
            }
            default: {
                ParametersImpl& impl = ParametersInternal::Impl(bag);
                impl.objectArrays.erase(name);
                impl.elementTypes.erase(name);
                int count = Pick(0, 3);
                std::vector<Parameters*>* elements =
                    impl.GetOrCreateObjectArray(name, count == 0 && Pick(0, 1) ? "Point" : "");
                for (int i = 0; i < count; ++i) {
                    Parameters* element = impl.NewParameters("Parameters");
                    Fill(*element, depth - 1);
                    elements->push_back(element);
                }
            }
        }
    }

    std::mt19937_64 random_;
};

}  // namespace Testing
}  // namespace Tarn

#endif  // TARN_TESTS_PARAMETERS_BAGTESTING_H_
