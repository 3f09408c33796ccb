// Walking a bag with its iterator and rendering it as JSON.
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include <cmath>
#include <limits>
#include <stdexcept>

#include "Nimbo/Context.h"
#include "Tarn/ParametersIterator.h"
#include "Tarn/Types.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

class JsonIterationTest : public ::testing::Test {
protected:
    std::string Json(const Parameters& bag) {
        ZelUnicodeString text;
        EXPECT_EQ(bag.ToJSON(text), 0);
        return text.str();
    }
    std::string ValueOf(const Parameters& bag) {
        ZelUnicodeString value;
        bag.Begin().GetStringValue(value);
        return value.str();
    }

    Nimbo::Context context_;
    Types types_{context_};
};

TEST_F(JsonIterationTest, EmptyBag) {
    Parameters bag(types_);
    EXPECT_TRUE(bag.Begin() == bag.End());
    EXPECT_EQ(Json(bag), "{}");
    ZelUnicodeString value = "stale";
    bag.End().GetStringValue(value);
    EXPECT_EQ(value, "");
}

TEST_F(JsonIterationTest, KindsComeInKindOrderWhateverTheNames) {
    Parameters bag(types_);
    bag.WriteInt32("a", 5);
    bag.WriteString("s", "x");
    EXPECT_EQ(Json(bag), "{\"s\":{\"type\":\"string\",\"value\":\"x\"},"
                         "\"a\":{\"type\":\"int32\",\"value\":5}}");
}

TEST_F(JsonIterationTest, ScalarRenderings) {
    struct Case {
        const char* what;
        std::function<void(Parameters&)> write;
        const char* type;
        const char* value;
    };
    const Case cases[] = {
        {"bool", [](Parameters& p) { p.WriteBool("v", true); }, "bool", "1"},
        {"int8", [](Parameters& p) { p.WriteInt8("v", -1); }, "int8", "-1"},
        {"uint8", [](Parameters& p) { p.WriteUint8("v", 255); }, "uint8", "255"},
        {"int64", [](Parameters& p) { p.WriteInt64("v", -9223372036854775807LL - 1); }, "int64",
         "-9223372036854775808"},
        {"uint64", [](Parameters& p) { p.WriteUint64("v", 18446744073709551615ULL); }, "uint64",
         "18446744073709551615"},
        {"float", [](Parameters& p) { p.WriteFloat("v", 0.5f); }, "float", "0.5"},
        {"double", [](Parameters& p) { p.WriteDouble("v", 1e20); }, "double", "1e+20"},
        {"infinity", [](Parameters& p) { p.WriteDouble("v", HUGE_VAL); }, "double", "null"},
        {"nan", [](Parameters& p) { p.WriteFloat("v", std::nanf("")); }, "float", "null"},
        {"buffer", [](Parameters& p) { p.WriteBuffer("v", "0123456789ab", 12); }, "buffer",
         "\"buffer(12)\""},
        {"strings", [](Parameters& p) { p.WriteStringArray("v", {"a", "b"}); }, "string[]",
         "[\"a\",\"b\"]"},
        {"bools", [](Parameters& p) { p.WriteBoolArray("v", std::vector<bool>{true, false}); },
         "bool[]", "[1,0]"},
        {"floats", [](Parameters& p) { p.WriteFloatArray("v", std::vector<float>{0.25f}); },
         "float[]", "[0.25]"},
        {"empty", [](Parameters& p) { p.WriteInt32Array("v", std::vector<int>{}); }, "int32[]",
         "[]"},
    };
    for (const Case& c : cases) {
        Parameters bag(types_);
        c.write(bag);
        EXPECT_EQ(bag.Begin().GetType(), c.type) << c.what;
        EXPECT_EQ(ValueOf(bag), c.value) << c.what;
    }
}

TEST_F(JsonIterationTest, NestedBagsRenderAsWholeTexts) {
    Parameters nested(types_);
    nested.WriteInt32("n", 1);
    Parameters bag(types_);
    bag.WriteParameters("o", nested);
    bag.WriteObjectArray("arr", "Parameters", {&nested, &nested});
    bag.WriteObjectArray("none", "Point", {});
    EXPECT_EQ(Json(bag),
              "{\"o\":{\"type\":\"Parameters\",\"value\":{\"n\":{\"type\":\"int32\",\"value\":1}}},"
              "\"arr\":{\"type\":\"Parameters[]\",\"value\":[{\"n\":{\"type\":\"int32\",\"value\":"
              "1}},{\"n\":{\"type\":\"int32\",\"value\":1}}]},"
              "\"none\":{\"type\":\"Point[]\",\"value\":[]}}");
}

TEST_F(JsonIterationTest, HostileTextStaysParsable) {
    Parameters bag(types_);
    bag.WriteString("quote\"name\\", "say \"hi\"\\\n\t\x01");
    bag.WriteStringArray("list", {"\"", "\x1f"});
    bag.WriteDouble("nan", std::nan(""));
    ParametersInternal::Impl(bag).GetOrCreateObject("o\"")->WriteString("k", "\"");
    nlohmann::json parsed = nlohmann::json::parse(Json(bag));
    EXPECT_EQ(parsed["quote\"name\\"]["value"], "say \"hi\"\\\n\t\x01");
    EXPECT_EQ(parsed["list"]["value"][1], "\x1f");
    EXPECT_TRUE(parsed["nan"]["value"].is_null());
    EXPECT_EQ(parsed["o\""]["value"]["k"]["value"], "\"");
}

TEST_F(JsonIterationTest, IteratorWalksOwnPropertiesOnly) {
    Parameters defaults(types_);
    defaults.WriteInt32("fromDefaults", 1);
    Parameters bag(types_);
    ParametersInternal::Impl(bag).SetDefaults(&defaults);
    bag.WriteInt32("x", 1);
    bag.WriteString("x", "s");
    std::vector<std::string> seen;
    for (ParametersIterator it = bag.Begin(); it != bag.End(); ++it) {
        seen.push_back(it.GetName().str() + ":" + it.GetType().str());
    }
    EXPECT_EQ(seen, (std::vector<std::string>{"x:string", "x:int32"}));

    ParametersIterator it = bag.Begin();
    ParametersIterator before = it++;
    EXPECT_EQ(before.GetType(), "string");
    EXPECT_EQ(it.GetType(), "int32");
    ++it;
    EXPECT_TRUE(it == bag.End());
    ++it;  // past the end stays at the end
    EXPECT_TRUE(it == bag.End());
    EXPECT_EQ(it.GetName(), "x");  // the last property visited
}

TEST_F(JsonIterationTest, DescendingIntoObjectsAndArrays) {
    Parameters element(types_);
    element.WriteInt32("e", 1);
    Parameters bag(types_);
    bag.WriteString("s", "x");
    bag.WriteParameters("o", element);
    bag.WriteObjectArray("arr", "Parameters", {&element, &element});

    ParametersIterator s = bag.Begin();
    EXPECT_FALSE(s.IsObject());
    EXPECT_EQ(s.GetObjectArraySize(), 0u);
    EXPECT_TRUE(s.ObjectBegin() == bag.End());
    EXPECT_TRUE(s.ObjectArrayBegin(0) == bag.End());

    ParametersIterator o = s;
    ++o;
    ASSERT_TRUE(o.IsObject());
    ParametersIterator inner = o.ObjectBegin();
    EXPECT_EQ(inner.GetName(), "e");
    EXPECT_TRUE(++inner == o.ObjectEnd());

    ParametersIterator arr = o;
    ++arr;
    ASSERT_TRUE(arr.IsObjectArray());
    EXPECT_EQ(arr.GetObjectArraySize(), 2u);
    EXPECT_EQ(arr.ObjectArrayBegin(1).GetName(), "e");
    EXPECT_TRUE(arr.ObjectArrayBegin(1) != arr.ObjectArrayBegin(0));
    EXPECT_THROW(arr.ObjectArrayBegin(2), std::out_of_range);
    EXPECT_THROW(arr.ObjectArrayEnd(2), std::out_of_range);
}

TEST_F(JsonIterationTest, AnEmptyObjectArrayWithoutTypeShowsBareBrackets) {
    Parameters bag(types_);
    ParametersInternal::Impl(bag).GetOrCreateObjectArray("a", "");
    EXPECT_EQ(Json(bag), "{\"a\":{\"type\":\"[]\",\"value\":[]}}");
}

}  // namespace
}  // namespace Tarn
