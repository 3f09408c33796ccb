// The binary form of a bag: round trips, the layout of the frame, and hostile input.
#include <gtest/gtest.h>

#include <cstring>
#include <string>

#include "Nimbo/BinaryReader.h"
#include "Nimbo/BinaryWriter.h"
#include "Nimbo/Context.h"
#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "Tarn/Binary.h"
#include "Tarn/Types.h"
#include "parameters/BagTesting.h"
#include "parameters/KindSamples.h"

namespace Tarn {
namespace {

using Testing::SameBag;

constexpr unsigned int kMagic = 0x54410001u;

class EncodingTest : public ::testing::Test {
protected:
    Parameters RoundTrip(const Parameters& bag) { return Parameters(types_, bag.ToBinary()); }

    static long Decode(Parameters& bag, const Nimbo::Binary& bytes) {
        return ParametersInternal::FromBinary(bag, bytes);
    }

    // The frame of a bag of object type `type` around `body`.
    static Nimbo::Binary Frame(const ZelUnicodeString& type, const Nimbo::Binary& body) {
        Nimbo::BinaryWriter writer;
        writer.WriteUint32(kMagic);
        writer.WriteString(type);
        writer.WriteBuffer(body);
        return writer.CreateBinary();
    }

    Nimbo::Context context_;
    Types types_{context_};
};

TEST_F(EncodingTest, EmptyBagIsTheFrameAlone) {
    Parameters empty(types_);
    Nimbo::Binary bytes = empty.ToBinary();
    Nimbo::BinaryReader reader(bytes);
    unsigned int magic = 0;
    ZelUnicodeString type;
    ASSERT_EQ(reader.ReadUint32(magic), S_OK);
    ASSERT_EQ(reader.ReadString(type), S_OK);
    EXPECT_EQ(magic, kMagic);
    EXPECT_EQ(type, "Parameters");
    EXPECT_EQ(reader.Remaining(), 0u);

    Parameters back = RoundTrip(empty);
    EXPECT_TRUE(back.IsEmpty());
    EXPECT_EQ(back.GetObjectType(), "Parameters");
}

TEST_F(EncodingTest, EveryKindComesBackExactly) {
    const std::vector<Testing::KindSample> rows = Testing::EveryWriterForm();
    Parameters bag(types_);
    for (std::size_t i = 0; i < rows.size(); ++i) {
        ASSERT_EQ(rows[i].write(bag, ZelUnicodeString().BuildFromNum(static_cast<int>(i))), S_OK);
    }
    bag.WriteDouble("whole", 2.0);  // a whole-valued double stays a double
    Parameters back = RoundTrip(bag);
    std::string why;
    EXPECT_TRUE(SameBag(bag, back, &why)) << why;
    for (std::size_t i = 0; i < rows.size(); ++i) {
        SCOPED_TRACE(rows[i].kind + " via " + rows[i].form);
        EXPECT_EQ(rows[i].read(back, ZelUnicodeString().BuildFromNum(static_cast<int>(i))), S_OK);
    }
    double whole = 0;
    EXPECT_EQ(back.ReadDouble("whole", whole), S_OK);
}

TEST_F(EncodingTest, OneNameInSeveralKindsKeepsEach) {
    Parameters bag(types_);
    bag.WriteInt32("x", 7);
    bag.WriteString("x", "seven");
    Parameters back = RoundTrip(bag);
    int i = 0;
    ZelUnicodeString s;
    EXPECT_EQ(back.ReadInt32("x", i), S_OK);
    EXPECT_EQ(back.ReadString("x", s), S_OK);
    EXPECT_EQ(i, 7);
    EXPECT_EQ(s, "seven");
    // The string entry comes first.
    ZelUnicodeString json;
    back.ToJSON(json);
    EXPECT_EQ(json, "{\"x\":{\"type\":\"string\",\"value\":\"seven\"},"
                    "\"x\":{\"type\":\"int32\",\"value\":7}}");
}

TEST_F(EncodingTest, ObjectTypesSurviveThreeLevelsOfNesting) {
    Parameters inner(types_);
    inner.WriteInt32("depth", 3);
    ParametersInternal::Impl(inner).SetObjectType("Inner");
    Parameters middle(types_);
    ParametersInternal::Impl(middle).SetObjectType("Middle");
    ParametersInternal::Impl(middle).objects.emplace("inner", std::make_unique<Parameters>(inner));
    Parameters outer(types_);
    ParametersInternal::Impl(outer).SetObjectType("Outer");
    ParametersInternal::Impl(outer).objects.emplace("middle", std::make_unique<Parameters>(middle));

    Parameters back = RoundTrip(outer);
    std::string why;
    EXPECT_TRUE(SameBag(outer, back, &why)) << why;
    EXPECT_EQ(back.GetObjectType(), "Outer");
    Parameters* m = ParametersInternal::Impl(back).FindObject("middle");
    ASSERT_NE(m, nullptr);
    EXPECT_EQ(m->GetObjectType(), "Middle");
    Parameters* i = ParametersInternal::Impl(*m).FindObject("inner");
    ASSERT_NE(i, nullptr);
    EXPECT_EQ(i->GetObjectType(), "Inner");
}

TEST_F(EncodingTest, EmptyObjectArraysKeepTheirElementTypeOrItsAbsence) {
    Parameters bag(types_);
    bag.WriteObjectArray("typed", "Point", {});
    ParametersInternal::Impl(bag).GetOrCreateObjectArray("untyped", "");
    Parameters back = RoundTrip(bag);
    ZelUnicodeString type;
    EXPECT_TRUE(back.HasOwnTarnProperty("typed", type));
    EXPECT_EQ(type, "Point[]");
    EXPECT_FALSE(back.HasOwnTarnProperty("untyped"));
    EXPECT_TRUE(back.HasOwnTarnPropertyWithType("untyped", "objectArray"));
}

TEST_F(EncodingTest, RandomBagsRoundTrip) {
    for (unsigned int seed = 1; seed <= 300; ++seed) {
        Testing::BagGenerator generator(seed);
        Parameters bag(types_);
        generator.Fill(bag, 3);
        std::string why;
        Parameters back = RoundTrip(bag);
        ASSERT_TRUE(SameBag(bag, back, &why)) << "seed " << seed << ": " << why;
        // A copy is the same bag as its binary form.
        Parameters copy(bag);
        ASSERT_TRUE(SameBag(bag, copy, &why)) << "seed " << seed << ": " << why;
        ASSERT_TRUE(copy.ToBinary() == bag.ToBinary()) << "seed " << seed;
    }
}

TEST_F(EncodingTest, TheTypesAndCommandsHandlesDecodeAlike) {
    Parameters bag(types_);
    bag.WriteString("s", "x");
    Binary bytes(bag.ToBinary());
    Parameters back(types_, bytes);
    EXPECT_TRUE(SameBag(bag, back));
}

// --- Hostile input -------------------------------------------------------------------------------

TEST_F(EncodingTest, WrongMagicLeavesAnEmptyPlainBag) {
    Parameters bag(types_);
    bag.WriteInt32("keep", 1);
    ParametersInternal::Impl(bag).SetObjectType("T");
    Nimbo::Binary bytes = bag.ToBinary();
    std::string corrupt(static_cast<const char*>(bytes.GetData()), bytes.GetSize());
    corrupt[0] ^= 0x55;
    char* copy = new char[corrupt.size()];
    std::memcpy(copy, corrupt.data(), corrupt.size());
    Nimbo::Binary broken(copy, static_cast<unsigned int>(corrupt.size()),
                         Nimbo::deallocateArrayChar);

    Parameters target(types_);
    target.WriteInt32("old", 1);
    EXPECT_EQ(Decode(target, broken), E_FAIL);
    EXPECT_TRUE(target.IsEmpty());
    EXPECT_EQ(target.GetObjectType(), "Parameters");
    Parameters constructed(types_, broken);
    EXPECT_TRUE(constructed.IsEmpty());
    EXPECT_EQ(constructed.GetObjectType(), "Parameters");
}

TEST_F(EncodingTest, TruncationAtEveryByteNeverCrashesAndKeepsAPrefix) {
    Testing::BagGenerator generator(42);
    Parameters bag(types_);
    generator.Fill(bag, 3);
    bag.WriteObjectArray("zz", "Parameters", {&bag, &bag});
    Nimbo::Binary bytes = bag.ToBinary();
    for (unsigned int size = 0; size < bytes.GetSize(); ++size) {
        Parameters back(types_, bytes.Slice(0, size));
        // Whatever came back is a consistent bag: it encodes and decodes to itself.
        Parameters again = RoundTrip(back);
        ASSERT_TRUE(SameBag(back, again)) << "size " << size;
    }
}

TEST_F(EncodingTest, BufferEntryWithUnknownTagIsRefused) {
    Nimbo::TypedBinaryWriter body;
    body.WriteInt32("before", 1);
    unsigned int mark = body.BeginBuffer("odd");
    body.Raw().WriteInt32(2);
    body.Raw().WriteBuffer("xyz", 3);
    body.EndBuffer(mark);
    body.WriteArrayInt32("after", nullptr, 0);

    Parameters bag(types_);
    EXPECT_LT(Decode(bag, Frame("Parameters", body.CreateBinary())), 0);
    EXPECT_TRUE(bag.HasOwnTarnProperty("before"));
    EXPECT_FALSE(bag.HasOwnTarnProperty("odd"));
}

TEST_F(EncodingTest, ObjectArrayClaimingTwoToTheSixtyFourElementsKeepsThoseThatArrived) {
    Parameters element(types_);
    element.WriteInt32("v", 5);
    Nimbo::Binary encoded = element.ToBinary();

    Nimbo::TypedBinaryWriter body;
    unsigned int mark = body.BeginBuffer("arr");
    body.Raw().WriteInt32(3);
    body.Raw().WriteUint64(~0ULL);
    for (int i = 0; i < 2; ++i) {
        body.Raw().WriteUint64(encoded.GetSize());
        body.Raw().WriteBuffer(encoded);
    }
    body.Raw().WriteUint64(1ULL << 40);  // an element larger than what is left
    body.EndBuffer(mark);
    body.WriteInt32("after", 9);

    Parameters bag(types_);
    EXPECT_EQ(Decode(bag, Frame("Parameters", body.CreateBinary())), S_OK);
    EXPECT_EQ(ParametersInternal::Impl(bag).objectArrays["arr"].elements.size(), 2u);
    int after = 0;
    EXPECT_EQ(bag.ReadInt32("after", after), S_OK);
}

TEST_F(EncodingTest, ElementThatFailsToDecodeEndsTheArray) {
    Nimbo::TypedBinaryWriter body;
    unsigned int mark = body.BeginBuffer("arr");
    body.Raw().WriteInt32(3);
    body.Raw().WriteUint64(1);
    body.Raw().WriteUint64(4);
    body.Raw().WriteUint32(0xDEADBEEF);
    body.EndBuffer(mark);
    Parameters bag(types_);
    EXPECT_LT(Decode(bag, Frame("Parameters", body.CreateBinary())), 0);
    EXPECT_TRUE(ParametersInternal::Impl(bag).objectArrays["arr"].elements.empty());
}

TEST_F(EncodingTest, NestingBeyondSixtyFourLevelsFailsWithoutExhaustingTheStack) {
    auto nested = [](int levels) {
        Nimbo::TypedBinaryWriter writer;
        std::vector<unsigned int> marks;
        for (int i = 0; i < levels; ++i) {
            writer.Raw().WriteUint32(kMagic);
            writer.Raw().WriteString("Parameters");
            marks.push_back(writer.BeginBuffer("n"));
        }
        writer.Raw().WriteUint32(kMagic);
        writer.Raw().WriteString("Leaf");
        writer.WriteInt32("leaf", 1);
        for (auto mark = marks.rbegin(); mark != marks.rend(); ++mark) writer.EndBuffer(*mark);
        return writer.CreateBinary();
    };
    Parameters deep(types_);
    EXPECT_EQ(Decode(deep, nested(64)), S_OK);
    Parameters tooDeep(types_);
    EXPECT_LT(Decode(tooDeep, nested(65)), 0);
    Parameters hostile(types_);
    EXPECT_LT(Decode(hostile, nested(10000)), 0);
}

}  // namespace
}  // namespace Tarn
