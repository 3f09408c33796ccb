// Type names of the 27 kinds, the classification of other type names, and the conversion of a
// double into each numeric kind through WriteNumber and WriteNumberArray.
#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>
#include <map>
#include <string>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"
#include "parameters/ErrorCapture.h"
#include "parameters/ParametersImpl.h"
#include "parameters/ValueKind.h"

namespace Tarn {
namespace {

const char* const kCanonicalNames[] = {
    "string",   "bool",    "int8",     "uint8",   "int16",    "uint16",      "int32",
    "uint32",   "int64",   "uint64",   "float",   "double",   "buffer",      "object",
    "string[]", "bool[]",  "int8[]",   "uint8[]", "int16[]",  "uint16[]",    "int32[]",
    "uint32[]", "int64[]", "uint64[]", "float[]", "double[]", "objectArray",
};

TEST(ValueKindTest, KindsAreNumberedInCanonicalOrderAndNamedExactly) {
    for (int i = 1; i <= kKindCount; ++i) {
        const ZelUnicodeString name = kCanonicalNames[i - 1];
        EXPECT_EQ(name, KindName(static_cast<ValueKind>(i)));
        EXPECT_EQ(static_cast<ValueKind>(i), KindOfTypeName(name)) << name;
        // A simple array holds the kind named without its "[]".
        if (IsSimpleArrayKind(static_cast<ValueKind>(i))) {
            EXPECT_EQ(KindOfTypeName(name.SubString(0, name.GetLengthInByte() - 2)),
                      ElementKind(static_cast<ValueKind>(i)))
                << name;
        }
    }
    EXPECT_EQ(ValueKind::None, ElementKind(ValueKind::ObjectArray));
    EXPECT_EQ(ValueKind::None, ElementKind(ValueKind::Int32));
}

TEST(ValueKindTest, TypeNamesFallIntoKindObjectAndObjectArrayNames) {
    struct Case {
        const char* name;
        bool kind, objectArray, object, builtIn;
        const char* element;  // for object-array names
    } cases[] = {{"string[]", true, false, false, true, ""},
                 {"object", true, false, false, false, ""},
                 {"objectArray", true, false, false, false, ""},
                 {"Parameters", false, false, true, true, ""},
                 {"Int32", false, false, true, false, ""},
                 {"Point", false, false, true, false, ""},
                 {"Point[]", false, true, false, false, "Point"},
                 {"String[]", false, true, false, false, "String"},
                 {"a[]b[]", false, true, false, false, "ab"}};
    for (const Case& c : cases) {
        SCOPED_TRACE(c.name);
        EXPECT_EQ(c.kind, KindOfTypeName(c.name) != ValueKind::None);
        EXPECT_EQ(c.objectArray, IsObjectArrayTypeName(c.name));
        EXPECT_EQ(c.object, IsObjectTypeName(c.name));
        EXPECT_EQ(c.builtIn, IsBuiltInTypeName(c.name));
        if (c.objectArray) {
            EXPECT_EQ(c.element, ElementTypeName(c.name));
        }
    }
}

class WriteNumberTest : public ::testing::Test {
protected:
    // The numeric property "n" and the array "a" of the given kind, read back as long doubles.
    std::vector<long double> ReadBack(const std::string& type) {
        std::vector<long double> values;
        auto take = [&](auto scalarRead, auto arrayRead, auto sample) {
            decltype(sample) value{};
            std::vector<decltype(sample)> array;
            EXPECT_EQ(S_OK, (p.*scalarRead)("n", value));
            EXPECT_EQ(S_OK, (p.*arrayRead)("a", array));
            values.push_back(static_cast<long double>(value));
            for (auto element : array) values.push_back(static_cast<long double>(element));
        };
        using P = Parameters;
        if (type == "int8") take(&P::ReadInt8, &P::ReadInt8Array, (signed char)0);
        if (type == "uint8") take(&P::ReadUint8, &P::ReadUint8Array, (unsigned char)0);
        if (type == "int16") take(&P::ReadInt16, &P::ReadInt16Array, (short)0);
        if (type == "uint16") take(&P::ReadUint16, &P::ReadUint16Array, (unsigned short)0);
        if (type == "int32") take(&P::ReadInt32, &P::ReadInt32Array, 0);
        if (type == "uint32") take(&P::ReadUint32, &P::ReadUint32Array, 0u);
        if (type == "int64") take(&P::ReadInt64, &P::ReadInt64Array, 0LL);
        if (type == "uint64") take(&P::ReadUint64, &P::ReadUint64Array, 0ULL);
        if (type == "float") take(&P::ReadFloat, &P::ReadFloatArray, 0.0f);
        if (type == "double") take(&P::ReadDouble, &P::ReadDoubleArray, 0.0);
        return values;
    }
    long Write(const std::string& type, double value) {
        long scalar = Impl().WriteNumber("n", type, value);
        long array = Impl().WriteNumberArray("a", type + "[]", {value, value});
        EXPECT_EQ(scalar, array) << type;
        return scalar;
    }
    ParametersImpl& Impl() { return ParametersInternal::Impl(p); }

    Testing::ErrorCapture errors;
    Nimbo::Context context;
    Types types{context};
    Parameters p{types};
};

TEST_F(WriteNumberTest, ConvertsByTruncationAndKeepsTheLowBits) {
    struct Case {
        const char* type;
        double input;
        long double stored;
    } cases[] = {{"uint8", 300.7, 44},
                 {"uint8", -1.0, 255},
                 {"int8", -1.0, -1},
                 {"int8", 200.0, -56},
                 {"int16", 40000.0, -25536},
                 {"uint16", 70000.9, 4464},
                 {"int32", 2.9, 2},
                 {"int32", -2.9, -2},
                 {"int32", -2147483648.0, -2147483648.0L},
                 {"uint32", -1.0, 4294967295.0L},
                 {"uint32", 4294967301.0, 5},
                 {"int64", -2.5, -2},
                 {"uint64", 1.0e19, 10000000000000000000.0L},
                 {"uint64", 9223372036854775808.0, 9223372036854775808.0L},
                 {"uint64", 18446744073709549568.0, 18446744073709549568.0L},
                 {"float", 0.1, static_cast<long double>(0.1f)},
                 {"float", 16777217.0, 16777216},
                 {"double", 0.1, static_cast<long double>(0.1)}};
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.type) + " from " + std::to_string(c.input));
        ASSERT_EQ(S_OK, Write(c.type, c.input));
        EXPECT_EQ(std::vector<long double>(3, c.stored), ReadBack(c.type));
    }
}

TEST_F(WriteNumberTest, NaNAndOutOfRangeInputsStoreSomeValueOfTheKind) {
    const double inputs[] = {
        std::nan(""),          HUGE_VAL, -HUGE_VAL, 1.0e300, -1.0e300, 18446744073709551616.0,
        -9223372036854777856.0};
    for (const char* type :
         {"int8", "uint8", "int16", "uint16", "int32", "uint32", "int64", "uint64", "float"}) {
        for (double input : inputs) {
            SCOPED_TRACE(std::string(type) + " from " + std::to_string(input));
            EXPECT_EQ(S_OK, Write(type, input));
            EXPECT_EQ(3u, ReadBack(type).size());
        }
    }
    Write("float", std::nan(""));
    EXPECT_TRUE(std::isnan(static_cast<double>(ReadBack("float")[0])));
    Write("float", 1.0e39);
    EXPECT_EQ(std::numeric_limits<float>::infinity(), ReadBack("float")[2]);
}

TEST_F(WriteNumberTest, NonNumericTypeNamesFailSilentlyAndStoreNothing) {
    for (const char* type : {"bool", "string", "buffer", "object", "objectArray", "Parameters",
                             "Int32", "int", "", "int32[]", "bool[]", "Point[]"}) {
        EXPECT_EQ(E_FAIL, Impl().WriteNumber("n", type, 1.0)) << type;
    }
    for (const char* type : {"bool[]", "string[]", "int32", "objectArray", "Int32[]", "Point[]"}) {
        EXPECT_EQ(E_FAIL, Impl().WriteNumberArray("a", type, {1.0})) << type;
    }
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_EQ(std::vector<Testing::PublishedError>{}, errors.Errors());
}

}  // namespace
}  // namespace Tarn
