// The property store: typed writers and readers, kinds kept apart, existence and type queries, the
// defaults link, removal and emptiness.
#include <gtest/gtest.h>

#include <algorithm>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Parameters.h"
#include "Tarn/Types.h"
#include "parameters/ErrorCapture.h"
#include "parameters/KindSamples.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

using Testing::ErrorCapture;
using Testing::KindSample;
using Testing::PublishedError;

const char kSource[] = "TarnCommandBinder";

class ParametersStoreTest : public ::testing::Test {
protected:
    ParametersImpl& Impl(Parameters& p) { return ParametersInternal::Impl(p); }
    // A new bag holding `name` under every kind whose type name is not `except`.
    std::unique_ptr<Parameters> Holding(const ZelUnicodeString& name, const std::string& except) {
        auto bag = std::make_unique<Parameters>(types);
        for (const KindSample& row : Testing::OneSamplePerKind()) {
            if (row.kind != except) {
                EXPECT_EQ(S_OK, row.write(*bag, name)) << row.kind;
            }
        }
        return bag;
    }

    ErrorCapture errors;
    Nimbo::Context context;
    Types types{context};
    Parameters p{types};
};

// What each reader publishes before the name and ">"; blanks pad the array names to one width.
const std::map<std::string, std::string> kUnknownText = {
    {"string", "Parameters::ReadString() unknown property <"},
    {"bool", "Parameters::ReadBool() unknown property <"},
    {"int8", "Parameters::ReadInt8() unknown property <"},
    {"uint8", "Parameters::ReadUint8() unknown property <"},
    {"int16", "Parameters::ReadInt16() unknown property <"},
    {"uint16", "Parameters::ReadUint16() unknown property <"},
    {"int32", "Parameters::ReadInt32() unknown property <"},
    {"uint32", "Parameters::ReadUint32() unknown property <"},
    {"int64", "Parameters::ReadInt64() unknown property <"},
    {"uint64", "Parameters::ReadUint64() unknown property <"},
    {"float", "Parameters::ReadFloat() unknown property <"},
    {"double", "Parameters::ReadDouble() unknown property <"},
    {"buffer", "Parameters::ReadBuffer() unknown property <"},
    {"string[]", "Parameters::ReadStringArray() unknown property <"},
    {"bool[]", "Parameters::ReadBoolArray  () unknown property <"},
    {"int8[]", "Parameters::ReadInt8Array  () unknown property <"},
    {"uint8[]", "Parameters::ReadUint8Array () unknown property <"},
    {"int16[]", "Parameters::ReadInt16Array () unknown property <"},
    {"uint16[]", "Parameters::ReadUint16Array() unknown property <"},
    {"int32[]", "Parameters::ReadInt32Array () unknown property <"},
    {"uint32[]", "Parameters::ReadUint32Array() unknown property <"},
    {"int64[]", "Parameters::ReadInt64Array () unknown property <"},
    {"uint64[]", "Parameters::ReadUint64Array() unknown property <"},
    {"float[]", "Parameters::ReadFloatArray () unknown property <"},
    {"double[]", "Parameters::ReadDoubleArray() unknown property <"},
};

// The samples of the 25 kinds that have a reader.
std::vector<KindSample> Readable() {
    std::vector<KindSample> rows;
    for (const KindSample& row : Testing::OneSamplePerKind()) {
        if (kUnknownText.count(row.kind) != 0) rows.push_back(row);
    }
    EXPECT_EQ(kUnknownText.size(), rows.size());
    return rows;
}

TEST_F(ParametersStoreTest, EveryWriterFormReadsBackWithItsReportedType) {
    for (const KindSample& row : Testing::EveryWriterForm()) {
        SCOPED_TRACE(row.kind + " via " + row.form);
        Parameters bag(types);
        ASSERT_EQ(S_OK, row.write(bag, "v"));
        EXPECT_EQ(S_OK, row.read(bag, "v"));
        ZelUnicodeString type;
        EXPECT_TRUE(bag.HasOwnTarnProperty("v", type));
        EXPECT_EQ(row.type, type.str());
        EXPECT_TRUE(bag.ExistsWithType("v", row.kind));
        EXPECT_TRUE(bag.HasOwnTarnPropertyWithType("v", row.type));
    }
    EXPECT_EQ(std::vector<PublishedError>{}, errors.Errors());
}

TEST_F(ParametersStoreTest, BoolArrayFromBytesTakesEveryNonZeroByteAsTrue) {
    unsigned char bytes[] = {0, 2, 1};
    ASSERT_EQ(S_OK, p.WriteBoolArray("flags", reinterpret_cast<bool*>(bytes), 3));
    std::vector<bool> flags;
    ASSERT_EQ(S_OK, p.ReadBoolArray("flags", flags));
    EXPECT_EQ((std::vector<bool>{false, true, true}), flags);
}

TEST_F(ParametersStoreTest, EveryReaderPublishesItsTextWhenOnlyOtherKindsHoldTheName) {
    for (const KindSample& reader : Readable()) {
        SCOPED_TRACE(reader.kind);
        auto bag = Holding("speed", reader.kind);
        errors.Clear();
        EXPECT_EQ(E_FAIL, reader.read(*bag, "speed"));
        EXPECT_EQ((std::vector<PublishedError>{{kUnknownText.at(reader.kind) + "speed>", kSource}}),
                  errors.Errors());
        // The same bag holding the name under this kind too answers without a message.
        errors.Clear();
        auto full = Holding("speed", "");
        EXPECT_EQ(S_OK, reader.read(*full, "speed"));
        EXPECT_EQ(std::vector<PublishedError>{}, errors.Errors());
    }
}

TEST_F(ParametersStoreTest, SecondKindUnderOneNameKeepsTheFirstAndRemovalDropsBoth) {
    ASSERT_EQ(S_OK, p.WriteInt32("x", 7));
    ASSERT_EQ(S_OK, p.WriteBool("x", true));
    ZelUnicodeString type;
    EXPECT_TRUE(p.Exists("x", type));
    EXPECT_EQ("bool", type);
    int i = 0;
    EXPECT_EQ(S_OK, p.ReadInt32("x", i));
    EXPECT_EQ(7, i);
    EXPECT_TRUE(p.RemoveProperty("x"));
    EXPECT_FALSE(p.Exists("x"));
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_FALSE(p.RemoveProperty("x"));
}

TEST_F(ParametersStoreTest, ReportedTypeFollowsTheProbeOrderWhateverTheWriteOrder) {
    // Simple kinds in kind order, then the nested bag, then the object array.
    std::vector<KindSample> probe = Testing::OneSamplePerKind();
    auto object = std::find_if(probe.begin(), probe.end(),
                               [](const KindSample& row) { return row.kind == "object"; });
    std::rotate(object, object + 1, probe.end() - 1);
    for (size_t first = 0; first < probe.size(); ++first) {
        for (size_t later = first + 1; later < probe.size(); ++later) {
            SCOPED_TRACE(probe[first].kind + " before " + probe[later].kind);
            Parameters bag(types);
            probe[later].write(bag, "n");
            probe[first].write(bag, "n");
            ZelUnicodeString type;
            EXPECT_TRUE(bag.HasOwnTarnProperty("n", type));
            EXPECT_EQ(probe[first].type, type.str());
        }
    }
}

TEST_F(ParametersStoreTest, ReadsFallBackOneLinkOnlyButExistenceWalksTheChain) {
    auto grand = Holding("v", "");
    Parameters middle(types);
    Impl(middle).SetDefaults(grand.get());
    Impl(p).SetDefaults(&middle);
    for (const KindSample& reader : Readable()) {
        SCOPED_TRACE(reader.kind);
        EXPECT_EQ(S_OK, reader.read(middle, "v"));
        errors.Clear();
        EXPECT_EQ(E_FAIL, reader.read(p, "v"));
        EXPECT_EQ(std::vector<std::string>{kUnknownText.at(reader.kind) + "v>"}, errors.Messages());
        EXPECT_TRUE(p.ExistsWithType("v", reader.kind));
        EXPECT_FALSE(p.HasOwnTarnPropertyWithType("v", reader.kind));
    }
    ZelUnicodeString type;
    EXPECT_TRUE(p.Exists("v", type));
    EXPECT_EQ("string", type);
    EXPECT_FALSE(p.HasOwnTarnProperty("v"));
    EXPECT_FALSE(p.hasOwnTarnProperty("v"));
    EXPECT_FALSE(p.ExistsWithType("v", "Point"));
}

TEST_F(ParametersStoreTest, OwnValueHidesTheDefaultAndRemovalUncoversIt) {
    Parameters defaults(types);
    defaults.WriteInt32("x", 2);
    Impl(p).SetDefaults(&defaults);
    p.WriteInt32("x", 1);
    int x = 0;
    EXPECT_EQ(S_OK, p.ReadInt32("x", x));
    EXPECT_EQ(1, x);
    EXPECT_TRUE(p.RemoveProperty("x"));
    EXPECT_TRUE(p.Exists("x"));
    EXPECT_EQ(S_OK, p.ReadInt32("x", x));
    EXPECT_EQ(2, x);
    EXPECT_FALSE(p.RemoveProperty("x"));
    EXPECT_TRUE(defaults.HasOwnTarnProperty("x"));
}

TEST_F(ParametersStoreTest, ObjectArrayTypeComesFromFirstElementOrFirstRecord) {
    struct Case {
        const char* recorded;
        std::vector<const char*> elements;
        bool found;
        const char* type;
    } cases[] = {{"", {}, false, ""},
                 {"Point", {}, true, "Point[]"},
                 {"", {"Point", "Other"}, true, "Point[]"},
                 {"Other", {"Point"}, true, "Point[]"},
                 {"", {"Parameters"}, true, "Parameters[]"}};
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.recorded) + " / " + std::to_string(c.elements.size()));
        Parameters bag(types);
        auto* elements = Impl(bag).GetOrCreateObjectArray("a", c.recorded);
        for (const char* type : c.elements) elements->push_back(Impl(bag).NewParameters(type));
        // A later record never replaces the first.
        if (*c.recorded != '\0') Impl(bag).GetOrCreateObjectArray("a", "Other");
        ZelUnicodeString type = "unchanged";
        EXPECT_EQ(c.found, bag.HasOwnTarnProperty("a", type));
        EXPECT_EQ(c.found ? c.type : "unchanged", type);
        EXPECT_EQ(c.found, bag.Exists("a"));
        EXPECT_EQ(c.found, bag.HasOwnTarnPropertyWithType("a", c.type));
        EXPECT_FALSE(bag.HasOwnTarnPropertyWithType("a", "Other[]"));
        EXPECT_TRUE(bag.HasOwnTarnPropertyWithType("a", "objectArray"));
        EXPECT_TRUE(bag.ExistsWithType("a", "objectArray"));
        EXPECT_FALSE(bag.HasOwnTarnPropertyWithType("a", "object"));
        EXPECT_FALSE(bag.IsEmpty());
        EXPECT_TRUE(bag.RemoveProperty("a"));
        EXPECT_TRUE(bag.IsEmpty());
    }
}

TEST_F(ParametersStoreTest, TypedQueryMatchesKindNamesAndNestedObjectTypes) {
    p.WriteInt32("n", 1);
    Impl(p).GetOrCreateObject("plain");
    Impl(*Impl(p).GetOrCreateObject("point")).SetObjectType("Point");
    struct Case {
        const char* name;
        const char* type;
        bool expected;
    } cases[] = {{"n", "int32", true},
                 {"n", "Int32", false},
                 {"n", "int32[]", false},
                 {"n", "int16", false},
                 {"n", "object", false},
                 {"plain", "object", true},
                 {"plain", "Parameters", true},
                 {"plain", "Point", false},
                 {"plain", "objectArray", false},
                 {"plain", "Parameters[]", false},
                 {"point", "object", true},
                 {"point", "Point", true},
                 {"point", "Parameters", false},
                 {"point", "point", false},
                 {"missing", "object", false}};
    for (const Case& c : cases) {
        EXPECT_EQ(c.expected, p.HasOwnTarnPropertyWithType(c.name, c.type))
            << c.name << " " << c.type;
        EXPECT_EQ(c.expected, p.ExistsWithType(c.name, c.type)) << c.name << " " << c.type;
    }
    ZelUnicodeString type;
    EXPECT_TRUE(p.Exists("point", type));
    EXPECT_EQ("Point", type);
}

TEST_F(ParametersStoreTest, EmptinessIgnoresTheObjectType) {
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_EQ("Parameters", p.GetObjectType());
    Impl(p).SetObjectType("Point");
    EXPECT_TRUE(p.IsEmpty());
    EXPECT_EQ("Point", p.GetObjectType());
    p.WriteString("s", "");
    EXPECT_FALSE(p.IsEmpty());
    p.RemoveProperty("s");
    EXPECT_TRUE(p.IsEmpty());
}

TEST_F(ParametersStoreTest, ReadBufferPointsAtOneStoredCopyOfTheCallersBytes) {
    char source[] = {'a', 'b', 'c'};
    ASSERT_EQ(S_OK, p.WriteBuffer("b", source, 3));
    source[0] = 'z';
    const void* first = nullptr;
    const void* second = nullptr;
    unsigned int size = 0;
    ASSERT_EQ(S_OK, p.ReadBuffer("b", first, size));
    ASSERT_EQ(S_OK, p.ReadBuffer("b", second, size));
    EXPECT_EQ(first, second);
    EXPECT_NE(static_cast<const void*>(source), first);
    EXPECT_EQ("abc", std::string(static_cast<const char*>(first), size));

    // Zero bytes are never read from the pointer and give an empty block.
    ASSERT_EQ(S_OK, p.WriteBuffer("b", source, 0));
    ASSERT_EQ(S_OK, p.ReadBuffer("b", first, size));
    EXPECT_EQ(0u, size);
    EXPECT_EQ(nullptr, first);
}

TEST_F(ParametersStoreTest, NullDataWithNonZeroCountFailsStoresNothingAndNamesTheWriter) {
#define TARN_NULL_ARRAY(KIND)                                                   \
    {                                                                           \
        "Parameters::Write" #KIND "Array() null values for property <x>",       \
            [](Parameters& b) { return b.Write##KIND##Array("x", nullptr, 2); } \
    }
    struct Case {
        const char* text;
        std::function<long(Parameters&)> write;
    } cases[] = {{"Parameters::WriteBuffer() null data for property <x>",
                  [](Parameters& b) { return b.WriteBuffer("x", nullptr, 3); }},
                 TARN_NULL_ARRAY(String),
                 TARN_NULL_ARRAY(Bool),
                 TARN_NULL_ARRAY(Int8),
                 TARN_NULL_ARRAY(Uint8),
                 TARN_NULL_ARRAY(Int16),
                 TARN_NULL_ARRAY(Uint16),
                 TARN_NULL_ARRAY(Int32),
                 TARN_NULL_ARRAY(Uint32),
                 TARN_NULL_ARRAY(Int64),
                 TARN_NULL_ARRAY(Uint64),
                 TARN_NULL_ARRAY(Float),
                 TARN_NULL_ARRAY(Double)};
#undef TARN_NULL_ARRAY
    for (const Case& c : cases) {
        Parameters bag(types);
        errors.Clear();
        EXPECT_EQ(E_FAIL, c.write(bag)) << c.text;
        EXPECT_TRUE(bag.IsEmpty()) << c.text;
        EXPECT_EQ((std::vector<PublishedError>{{c.text, kSource}}), errors.Errors());
    }
}

TEST_F(ParametersStoreTest, RemovalOfWhatIsNotThereFails) {
    p.WriteInt32("o", 1);
    EXPECT_FALSE(p.RemoveProperty("missing"));
    EXPECT_EQ(E_FAIL, Impl(p).RemoveObject("o"));
    EXPECT_FALSE(Impl(p).RemoveUint8("o"));
    EXPECT_TRUE(p.HasOwnTarnProperty("o"));
    Impl(p).GetOrCreateObject("o")->WriteInt32("inner", 1);
    EXPECT_EQ(S_OK, Impl(p).RemoveObject("o"));
    EXPECT_EQ(nullptr, Impl(p).FindObject("o"));
    EXPECT_TRUE(p.HasOwnTarnPropertyWithType("o", "int32"));
    EXPECT_EQ(std::vector<PublishedError>{}, errors.Errors());
}

}  // namespace
}  // namespace Tarn
