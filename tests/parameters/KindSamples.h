// Sample values of every kind: how to write one under a name and how to read it back. Suites build
// bags holding every kind (or every kind but one) from these rows.
#ifndef TARN_TESTS_PARAMETERS_KINDSAMPLES_H_
#define TARN_TESTS_PARAMETERS_KINDSAMPLES_H_

#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace Testing {

using Access = std::function<long(const Parameters&, const ZelUnicodeString&)>;

struct KindSample {
    std::string form;  // which writer form the row uses
    std::string kind;  // the kind's type name
    std::string type;  // the type reported for the property
    std::function<long(Parameters&, const ZelUnicodeString&)> write;
    // Reads the name back with the kind's reader into an output preset to a value unlike the
    // sample; expects the sample on success and the untouched preset on failure.
    Access read;
};

namespace samples {

template <typename T, typename R>
Access ReadExpecting(R read, T stored, T preset) {
    return [=](const Parameters& p, const ZelUnicodeString& name) {
        T out = preset;
        long result = (p.*read)(name, out);
        EXPECT_EQ(result < 0 ? preset : stored, out);
        return result;
    };
}

template <typename T, typename W, typename R>
KindSample Scalar(const char* kind, W write, R read, T value) {
    return {"scalar", kind, kind,
            [=](Parameters& p, const ZelUnicodeString& name) { return (p.*write)(name, value); },
            ReadExpecting(read, value, T{})};
}

// Four rows: both overloads with `values`, then both with no element.
template <typename T>
std::vector<KindSample> Array(
    const char* kind, long (Parameters::*byVector)(const ZelUnicodeString&, const std::vector<T>&),
    long (Parameters::*byPointer)(const ZelUnicodeString&, T*, unsigned int),
    long (Parameters::*read)(const ZelUnicodeString&, std::vector<T>&) const,
    std::vector<T> values) {
    auto fromPointer = [byPointer, values](Parameters& p, const ZelUnicodeString& name) {
        std::unique_ptr<T[]> copy(new T[values.size()]);
        std::copy(values.begin(), values.end(), copy.get());
        return (p.*byPointer)(name, copy.get(), static_cast<unsigned int>(values.size()));
    };
    const std::vector<T> stale(1);  // a preset element that a read must replace
    return {
        {"vector", kind, kind,
         [=](Parameters& p, const ZelUnicodeString& name) { return (p.*byVector)(name, values); },
         ReadExpecting(read, values, stale)},
        {"pointer", kind, kind, fromPointer, ReadExpecting(read, values, stale)},
        {"empty vector", kind, kind,
         [=](Parameters& p, const ZelUnicodeString& name) { return (p.*byVector)(name, {}); },
         ReadExpecting(read, std::vector<T>{}, stale)},
        {"null pointer, count 0", kind, kind,
         [=](Parameters& p, const ZelUnicodeString& name) {
             return (p.*byPointer)(name, nullptr, 0);
         },
         ReadExpecting(read, std::vector<T>{}, stale)},
    };
}

inline KindSample Buffer(const char* form, std::string bytes, bool asBinary) {
    return {form, "buffer", "buffer",
            [=](Parameters& p, const ZelUnicodeString& name) {
                const char* data = bytes.empty() ? nullptr : bytes.data();
                auto size = static_cast<unsigned int>(bytes.size());
                return asBinary ? p.WriteBuffer(name, Nimbo::Binary(data, size, nullptr))
                                : p.WriteBuffer(name, data, size);
            },
            [=](const Parameters& p, const ZelUnicodeString& name) {
                static const char preset = 0;
                const void* data = &preset;
                unsigned int size = 99;
                long result = p.ReadBuffer(name, data, size);
                if (result < 0) {
                    EXPECT_TRUE(data == &preset && size == 99)
                        << "a failed read changed its output";
                } else {
                    EXPECT_EQ(bytes, std::string(static_cast<const char*>(data), size));
                }
                return result;
            }};
}

}  // namespace samples

// Every writer form of every kind, in the canonical kind order: the 12 scalars and the string, the
// buffer in three forms, a nested bag, each simple array in four forms, an object array.
inline std::vector<KindSample> EveryWriterForm() {
    using namespace samples;
    using P = Parameters;
    std::vector<KindSample> rows = {
        Scalar("string", &P::WriteString, &P::ReadString, ZelUnicodeString("caf\xc3\xa9 <x>")),
        Scalar("bool", &P::WriteBool, &P::ReadBool, true),
        Scalar("int8", &P::WriteInt8, &P::ReadInt8, static_cast<signed char>(-128)),
        Scalar("uint8", &P::WriteUint8, &P::ReadUint8, static_cast<unsigned char>(255)),
        Scalar("int16", &P::WriteInt16, &P::ReadInt16, static_cast<short>(-32768)),
        Scalar("uint16", &P::WriteUint16, &P::ReadUint16, static_cast<unsigned short>(65535)),
        Scalar("int32", &P::WriteInt32, &P::ReadInt32, -2147483647 - 1),
        Scalar("uint32", &P::WriteUint32, &P::ReadUint32, 4294967295u),
        Scalar("int64", &P::WriteInt64, &P::ReadInt64, -9223372036854775807LL - 1),
        Scalar("uint64", &P::WriteUint64, &P::ReadUint64, 18446744073709551615ULL),
        Scalar("float", &P::WriteFloat, &P::ReadFloat, 1.0e-40f),
        Scalar("double", &P::WriteDouble, &P::ReadDouble, -2.5e300),
        Buffer("pointer",
               std::string("\0\x01\xff"
                           "a",
                           4),
               false),
        Buffer("Nimbo::Binary", "bytes", true),
        Buffer("empty", "", false),
        {"nested bag", "object", "Parameters",
         [](Parameters& p, const ZelUnicodeString& name) {
             return ParametersInternal::Impl(p).GetOrCreateObject(name)->WriteInt32("inner", 5);
         },
         [](const Parameters& p, const ZelUnicodeString& name) {
             const Parameters* nested = ParametersInternal::Impl(p).FindObject(name);
             int inner = 0;
             if (nested == nullptr || nested->ReadInt32("inner", inner) < 0) return E_FAIL;
             EXPECT_EQ(5, inner);
             return S_OK;
         }},
    };
    auto append = [&rows](std::vector<KindSample> more) {
        rows.insert(rows.end(), more.begin(), more.end());
    };
    append(Array<ZelUnicodeString>("string[]", &P::WriteStringArray, &P::WriteStringArray,
                                   &P::ReadStringArray, {"a", "", "c"}));
    append(Array<bool>("bool[]", &P::WriteBoolArray, &P::WriteBoolArray, &P::ReadBoolArray,
                       {true, false, true, true, false, false, true, false, true}));
    append(Array<signed char>("int8[]", &P::WriteInt8Array, &P::WriteInt8Array, &P::ReadInt8Array,
                              {-128, 0, 127}));
    append(Array<unsigned char>("uint8[]", &P::WriteUint8Array, &P::WriteUint8Array,
                                &P::ReadUint8Array, {0, 128, 255}));
    append(Array<short>("int16[]", &P::WriteInt16Array, &P::WriteInt16Array, &P::ReadInt16Array,
                        {-32768, 1, 32767}));
    append(Array<unsigned short>("uint16[]", &P::WriteUint16Array, &P::WriteUint16Array,
                                 &P::ReadUint16Array, {0, 1, 65535}));
    append(Array<int>("int32[]", &P::WriteInt32Array, &P::WriteInt32Array, &P::ReadInt32Array,
                      {-2147483647 - 1, 0, 2147483647}));
    append(Array<unsigned int>("uint32[]", &P::WriteUint32Array, &P::WriteUint32Array,
                               &P::ReadUint32Array, {0, 4294967295u}));
    append(Array<long long>("int64[]", &P::WriteInt64Array, &P::WriteInt64Array, &P::ReadInt64Array,
                            {-9223372036854775807LL - 1, 42}));
    append(Array<unsigned long long>("uint64[]", &P::WriteUint64Array, &P::WriteUint64Array,
                                     &P::ReadUint64Array, {18446744073709551615ULL, 7}));
    append(Array<float>("float[]", &P::WriteFloatArray, &P::WriteFloatArray, &P::ReadFloatArray,
                        {0.1f, -0.0f, 3.4e38f}));
    append(Array<double>("double[]", &P::WriteDoubleArray, &P::WriteDoubleArray,
                         &P::ReadDoubleArray, {0.1, -1e-300}));
    rows.push_back({"two plain bags", "objectArray", "Parameters[]",
                    [](Parameters& p, const ZelUnicodeString& name) {
                        ParametersImpl& impl = ParametersInternal::Impl(p);
                        auto* elements = impl.GetOrCreateObjectArray(name, "");
                        for (int i = 0; i < 2; ++i) {
                            elements->push_back(impl.NewParameters("Parameters"));
                            elements->back()->WriteInt32("index", i);
                        }
                        return S_OK;
                    },
                    [](const Parameters& p, const ZelUnicodeString& name) {
                        const auto& arrays = ParametersInternal::Impl(p).objectArrays;
                        auto found = arrays.find(name);
                        if (found == arrays.end()) return E_FAIL;
                        const std::vector<Parameters*>& elements = found->second.elements;
                        EXPECT_EQ(2u, elements.size());
                        for (int i = 0; i < static_cast<int>(elements.size()); ++i) {
                            int index = -1;
                            elements[i]->ReadInt32("index", index);
                            EXPECT_EQ(i, index);
                        }
                        return S_OK;
                    }});
    return rows;
}

// The first writer form of each of the 27 kinds, in canonical kind order.
inline std::vector<KindSample> OneSamplePerKind() {
    std::vector<KindSample> rows;
    for (const KindSample& row : EveryWriterForm()) {
        if (rows.empty() || rows.back().kind != row.kind) rows.push_back(row);
    }
    return rows;
}

}  // namespace Testing
}  // namespace Tarn

#endif  // TARN_TESTS_PARAMETERS_KINDSAMPLES_H_
