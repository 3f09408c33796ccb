// Typed application objects in bags, the type registry, and whole nested bags.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "parameters/BagTesting.h"
#include "parameters/ErrorCapture.h"

namespace Tarn {
namespace {

using ::testing::ElementsAre;

struct Point {
    int x;
    int y;
};

// A point with x == -1 cannot be serialized.
long SerializePoint(Parameters& target, const void* object) {
    const Point& p = *static_cast<const Point*>(object);
    if (p.x == -1) return E_FAIL;
    target.WriteInt32("x", p.x);
    target.WriteInt32("y", p.y);
    return S_OK;
}

void* UnserializePoint(const Parameters& source) {
    auto* p = new Point{};
    if (source.ReadInt32("x", p->x) < 0 || source.ReadInt32("y", p->y) < 0) {
        delete p;
        return nullptr;
    }
    return p;
}

class TypedObjectsTest : public ::testing::Test {
protected:
    TypedObjectsTest() {
        EXPECT_EQ(registry().DeclareType("Point", &SerializePoint, &UnserializePoint), S_OK);
    }
    TypesImpl& registry() { return types_.GetImpl(); }

    Nimbo::Context context_;
    Types types_{context_};
    Testing::ErrorCapture errors_;
};

TEST_F(TypedObjectsTest, DeclarationsAreNeverReplaced) {
    EXPECT_EQ(registry().DeclareType("Parameters", &SerializePoint, &UnserializePoint), E_FAIL);
    EXPECT_EQ(registry().DeclareType("Point", &SerializePoint, &UnserializePoint), E_FAIL);
    EXPECT_EQ(registry().DeclareType("Half", &SerializePoint, nullptr), E_FAIL);
    EXPECT_EQ(registry().DeclareType("Other", nullptr, &UnserializePoint), E_FAIL);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Tarn::Type::DeclareType(), Parameters Type <Parameters> already registered",
                            "Tarn::Type::DeclareType(), Parameters Type <Point> already registered",
                            "Tarn::Type::DeclareType(), Parameters Type <Half> already registered",
                            "Tarn::Type::DeclareType(), Parameters Type <Other> already registered"));
    EXPECT_FALSE(registry().IsDeclared("Half"));
    EXPECT_EQ(errors_.Errors().front().source, "TarnCommandBinder");

    // "Parameters" still converts bags.
    Parameters source(types_);
    source.WriteInt32("v", 1);
    Parameters target(types_);
    EXPECT_EQ(registry().Serialize(&source, "Parameters", target), S_OK);
    EXPECT_TRUE(Testing::SameBag(source, target));
}

TEST_F(TypedObjectsTest, UnknownTypesAreReportedWithoutCallingAnything) {
    Parameters target(types_);
    Point p{1, 2};
    EXPECT_EQ(registry().Serialize(&p, "Nothing", target), E_FAIL);
    EXPECT_EQ(registry().Unserialize(target, "Nothing"), nullptr);
    ParametersInternal::Impl(target).SetObjectType("Nothing");
    EXPECT_EQ(registry().Unserialize(target, "Nothing"), nullptr);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Tarn::Type::Serialize(), Parameters Type <Nothing> not registered",
                            "Tarn::Type::Unserialize() failed, trying to unserialize type "
                            "<Parameters> as type <Nothing>",
                            "Tarn::Type::Unserialize(), Parameters Type <Nothing> not registered"));
}

TEST_F(TypedObjectsTest, ObjectArrayElementTypeSpellingIsAccepted) {
    Parameters source(types_);
    source.WriteInt32("x", 3);
    source.WriteInt32("y", 4);
    ParametersInternal::Impl(source).SetObjectType("objectArray of Point");
    std::unique_ptr<Point> p(static_cast<Point*>(registry().Unserialize(source, "Point")));
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(p->x, 3);
    EXPECT_TRUE(errors_.Messages().empty());
}

TEST_F(TypedObjectsTest, ObjectsRoundTripThroughABagAndItsBinaryForm) {
    Parameters bag(types_);
    Point p{3, 4};
    ASSERT_EQ(bag.WriteObject("where", "Point", &p), S_OK);
    ZelUnicodeString type;
    EXPECT_TRUE(bag.HasOwnTarnProperty("where", type));
    EXPECT_EQ(type, "Point");

    Parameters received(types_, bag.ToBinary());
    void* object = nullptr;
    ASSERT_EQ(received.ReadObject("where", "Point", object), S_OK);
    std::unique_ptr<Point> back(static_cast<Point*>(object));
    EXPECT_EQ(back->x, 3);
    EXPECT_EQ(back->y, 4);
}

TEST_F(TypedObjectsTest, WriteObjectReportsAFailedSerializationAndKeepsWhatWasWritten) {
    Parameters bag(types_);
    Point bad{-1, 0};
    EXPECT_EQ(bag.WriteObject("p", "Point", &bad), E_FAIL);
    EXPECT_EQ(bag.WriteObject("q", "Nothing", &bad), E_FAIL);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Parameters::WriteObject() serialization fail, property <p> type <Point>",
                            "Tarn::Type::Serialize(), Parameters Type <Nothing> not registered",
                            "Parameters::WriteObject() serialization fail, property <q> type <Nothing>"));
    EXPECT_TRUE(bag.HasOwnTarnPropertyWithType("p", "Point"));
}

TEST_F(TypedObjectsTest, WriteObjectArrayGoesOnPastAFailingElement) {
    Parameters bag(types_);
    Point a{1, 1}, bad{-1, 0}, c{3, 3};
    EXPECT_EQ(bag.WriteObjectArray("points", "Point", {&a, &bad, &c}), E_FAIL);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Parameters::WriteObjectArray() serialization fail, property <points> "
                            "type <Point>"));
    const auto& elements = ParametersInternal::Impl(bag).objectArrays["points"].elements;
    ASSERT_EQ(elements.size(), 3u);
    int x = 0;
    EXPECT_EQ(elements[2]->ReadInt32("x", x), S_OK);
    EXPECT_EQ(x, 3);
    EXPECT_TRUE(elements[1]->IsEmpty());
}

TEST_F(TypedObjectsTest, EmptyObjectArrayRecordsItsElementTypeAndAFilledOneDropsIt) {
    Parameters bag(types_);
    EXPECT_EQ(bag.WriteObjectArray("points", "Point", {}), S_OK);
    ZelUnicodeString type;
    EXPECT_TRUE(bag.Exists("points", type));
    EXPECT_EQ(type, "Point[]");
    EXPECT_TRUE(bag.HasOwnTarnPropertyWithType("points", "Point[]"));

    Point a{1, 2};
    EXPECT_EQ(bag.WriteObjectArray("points", "Parameters", {}), S_OK);
    EXPECT_TRUE(bag.HasOwnTarnPropertyWithType("points", "Parameters[]"));
    EXPECT_EQ(bag.WriteObjectArray("points", "Point", {&a}), S_OK);
    EXPECT_EQ(ParametersInternal::Impl(bag).elementTypes.count("points"), 0u);
}

TEST_F(TypedObjectsTest, ReadObjectFollowsTheWholeDefaultsChain) {
    Parameters last(types_);
    Point p{7, 8};
    last.WriteObject("deep", "Point", &p);
    Parameters middle(types_);
    ParametersInternal::Impl(middle).SetDefaults(&last);
    Parameters first(types_);
    ParametersInternal::Impl(first).SetDefaults(&middle);

    void* object = nullptr;
    ASSERT_EQ(first.ReadObject("deep", "Point", object), S_OK);
    delete static_cast<Point*>(object);
    EXPECT_EQ(first.ReadObject("nowhere", "Point", object), E_FAIL);
    EXPECT_EQ(object, nullptr);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Parameters::ReadObject() unknown property <nowhere>"));
}

TEST_F(TypedObjectsTest, ReadObjectNamesBothTypesOrTheFailedConversion) {
    Parameters bag(types_);
    Point p{1, 2};
    bag.WriteObject("p", "Point", &p);
    ParametersInternal::Impl(bag).FindObject("p")->RemoveProperty("y");
    void* object = reinterpret_cast<void*>(1);
    EXPECT_EQ(bag.ReadObject("p", "Parameters", object), E_FAIL);
    EXPECT_EQ(object, nullptr);
    EXPECT_EQ(bag.ReadObject("p", "Point", object), E_FAIL);
    EXPECT_EQ(object, nullptr);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Parameters::ReadObject() property <p> invalid type <Parameters> "
                            "expected type <Point>",
                            "Parameters::ReadInt32() unknown property <y>",
                            "Unserialize Error in Parameters::ReadObject() property <p> type <Point>"));
}

// --- Nested bags ---------------------------------------------------------------------------------

TEST_F(TypedObjectsTest, NestedBagsAreValuesAtEveryStep) {
    Parameters value(types_);
    value.WriteInt32("n", 1);
    Parameters bag(types_);
    ASSERT_EQ(bag.WriteParameters("inner", value), S_OK);
    value.WriteInt32("n", 2);

    Parameters out(types_);
    ASSERT_EQ(bag.ReadParameters("inner", "Parameters", out), S_OK);
    int n = 0;
    out.ReadInt32("n", n);
    EXPECT_EQ(n, 1);

    Parameters* copy = nullptr;
    ASSERT_EQ(bag.ReadParameters("inner", copy), S_OK);
    std::unique_ptr<Parameters> owned(copy);
    owned->WriteInt32("n", 3);
    ASSERT_EQ(bag.ReadParameters("inner", "Parameters", out), S_OK);
    out.ReadInt32("n", n);
    EXPECT_EQ(n, 1);
}

TEST_F(TypedObjectsTest, ReadingANestedBagIntoItsOwnParentIsSafe) {
    Parameters bag(types_);
    Parameters value(types_);
    value.WriteInt32("n", 5);
    bag.WriteParameters("inner", value);
    bag.WriteString("gone", "x");
    ASSERT_EQ(bag.ReadParameters("inner", "Parameters", bag), S_OK);
    EXPECT_TRUE(Testing::SameBag(bag, value));
}

TEST_F(TypedObjectsTest, ReadParametersWithAWrongTypePublishesTwoTexts) {
    Parameters bag(types_);
    Point p{1, 2};
    bag.WriteObject("p", "Point", &p);
    Parameters out(types_);
    out.WriteInt32("untouched", 1);
    EXPECT_EQ(bag.ReadParameters("p", "Parameters", out), E_FAIL);
    EXPECT_TRUE(out.HasOwnTarnProperty("untouched"));
    Parameters* copy = reinterpret_cast<Parameters*>(1);
    EXPECT_EQ(bag.ReadParameters("p", copy), E_FAIL);
    EXPECT_EQ(copy, nullptr);
    EXPECT_EQ(bag.ReadParameters("missing", "Parameters", out), E_FAIL);
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Parameters::ReadParameters(), invalid type for property <p> type "
                            "<Point> asked type <Parameters>",
                            "Parameters::ReadPropertyAsParameters(), property not found <p>",
                            "Parameters::ReadObject() property <p> invalid type <Parameters> "
                            "expected type <Point>",
                            "Parameters::ReadPropertyAsParameters(), property not found <missing>"));
}

TEST_F(TypedObjectsTest, DeclaringAnObjectTypeNeedsDeclarations) {
    Parameters bag(types_);
    bag.WriteInt32("x", 1);
    EXPECT_EQ(bag.DeclareAsObject("Parameters"), S_OK);
    EXPECT_EQ(bag.DeclareAsObject("Point"), E_FAIL);
    EXPECT_EQ(bag.GetObjectType(), "Parameters");
    bag.DeclareAsParameters();
    EXPECT_EQ(bag.GetObjectType(), "Parameters");

    Parameters typed(types_);
    ParametersInternal::Impl(typed).SetObjectType("Point");
    Parameters holder(types_);
    holder.WriteInt32("keep", 1);
    EXPECT_EQ(holder.WriteParameters("keep", typed), E_FAIL);
    EXPECT_FALSE(holder.HasOwnTarnPropertyWithType("keep", "object"));
    EXPECT_THAT(errors_.Messages(),
                ElementsAre("Cannot check Parameters consistency, no Tarn::DeclarativeContext - "
                            "Parameters::DeclareAsObject()",
                            "Cannot check Parameters consistency, no Tarn::DeclarativeContext - "
                            "Parameters::WriteParameters(keep)"));
}

TEST_F(TypedObjectsTest, CompareWithDefaultsListsUnknownAndMistypedProperties) {
    Parameters defaults(types_);
    defaults.WriteInt32("count", 0);
    defaults.WriteString("label", "");
    Parameters nested(types_);
    defaults.WriteParameters("options", nested);

    Parameters received(types_);
    received.WriteInt32("count", 5);
    received.WriteDouble("label", 1.0);
    received.WriteBool("extra", true);
    Point p{1, 2};
    received.WriteObject("options", "Point", &p);
    received.WriteObjectArray("list", "Point", {&p});

    std::vector<std::pair<ZelUnicodeString, ZelUnicodeString>> unknown;
    std::vector<std::pair<ZelUnicodeString, std::pair<ZelUnicodeString, ZelUnicodeString>>> wrong;
    EXPECT_EQ(ParametersInternal::Impl(received).CompareWithDefaults(defaults, unknown, wrong),
              E_FAIL);
    ASSERT_EQ(unknown.size(), 2u);
    EXPECT_EQ(unknown[0].first, "extra");
    EXPECT_EQ(unknown[0].second, "bool");
    EXPECT_EQ(unknown[1].first, "list");
    EXPECT_EQ(unknown[1].second, "Point");
    ASSERT_EQ(wrong.size(), 1u);
    EXPECT_EQ(wrong[0].first, "label");
    EXPECT_EQ(wrong[0].second.first, "double");
    EXPECT_EQ(wrong[0].second.second, "string");

    unknown.clear();
    wrong.clear();
    Parameters fine(types_);
    fine.WriteInt32("count", 1);
    fine.WriteObject("options", "Point", &p);  // object types do not matter
    EXPECT_EQ(ParametersInternal::Impl(fine).CompareWithDefaults(defaults, unknown, wrong), S_OK);
}

}  // namespace
}  // namespace Tarn
