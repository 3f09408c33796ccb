#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "codec/CodecTestSupport.h"

namespace {

using codec_test::Bytes;
using codec_test::Hex;
using Nimbo::Binary;
using Nimbo::TypedBinaryWriter;

TEST(TypedBinaryWriterTest, EntryIsTagNameThenPayload) {
    TypedBinaryWriter writer;
    ASSERT_EQ(S_OK, writer.WriteInt32("n", -5));
    ASSERT_EQ(S_OK, writer.WriteBool("", true));
    ASSERT_EQ(S_OK, writer.WriteStrings("s", {"ab", ""}));
    const short values[] = {1, -1};
    ASSERT_EQ(S_OK, writer.WriteArrayInt16("a", values, 2));
    ASSERT_EQ(S_OK, writer.WriteBuffer("b", "xyz", 3));

    // clang-format off
    const Binary expected = Bytes({
        7,  1, 0, 0, 0, 'n', 0xfb, 0xff, 0xff, 0xff,                            // int32
        2,  0, 0, 0, 0, 1,                                                      // bool
        14, 1, 0, 0, 0, 's', 2, 0, 0, 0, 2, 0, 0, 0, 'a', 'b', 0, 0, 0, 0,      // string[]
        18, 1, 0, 0, 0, 'a', 2, 0, 0, 0, 1, 0, 0xff, 0xff,                      // int16[]
        13, 1, 0, 0, 0, 'b', 3, 0, 0, 0, 'x', 'y', 'z',                         // buffer
    });
    // clang-format on
    const Binary written = writer.CreateBinary();
    EXPECT_EQ(expected, written) << Hex(written);
}

TEST(TypedBinaryWriterTest, ArraysNeedDataOnlyWhenTheyHaveElements) {
    TypedBinaryWriter writer;
    EXPECT_EQ(S_OK, writer.WriteArrayDouble("d", nullptr, 0));
    EXPECT_EQ(S_OK, writer.WriteBuffer("b", nullptr, 0));
    const unsigned int afterEmpty = writer.Tell();
    EXPECT_EQ(E_FAIL, writer.WriteArrayDouble("d", nullptr, 1));
    EXPECT_EQ(E_FAIL, writer.WriteArrayBool("b", nullptr, 3));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("b", nullptr, 1));
    EXPECT_EQ(afterEmpty, writer.Tell());
}

TEST(TypedBinaryWriterTest, RefusesAnEntryTooLargeForABlockAndWritesNothing) {
    TypedBinaryWriter writer;
    ASSERT_EQ(S_OK, writer.WriteUint8("u", 1));
    const unsigned int before = writer.Tell();
    // The sizes are checked before any element is read, so these pointers are never followed.
    const double one = 1;
    EXPECT_EQ(E_FAIL, writer.WriteArrayDouble("d", &one, 0x20000000u));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("b", &one, 0xFFFFFFF0u));
    EXPECT_EQ(before, writer.Tell());
}

// Bytes that a caller appends in place between BeginBuffer and EndBuffer.
void AppendPayload(Nimbo::BinaryWriter& raw, const std::string& payload) {
    raw.WriteInt32(1);
    raw.WriteBuffer(payload.data(), static_cast<unsigned int>(payload.size()));
}

TEST(TypedBinaryWriterTest, InPlaceBufferEqualsWriteBuffer) {
    for (const std::string& payload : {std::string(), std::string("abc"), std::string(5000, 'q')}) {
        SCOPED_TRACE(payload.size());
        Nimbo::BinaryWriter apart;
        AppendPayload(apart, payload);
        TypedBinaryWriter viaCopy;
        viaCopy.WriteString("before", "x");
        viaCopy.WriteBuffer("buf", apart.CreateBinary());
        viaCopy.WriteInt64("after", -1);

        TypedBinaryWriter inPlace;
        inPlace.WriteString("before", "x");
        const unsigned int mark = inPlace.BeginBuffer("buf");
        ASSERT_NE(TypedBinaryWriter::kInvalidMark, mark);
        AppendPayload(inPlace.Raw(), payload);
        ASSERT_EQ(S_OK, inPlace.EndBuffer(mark));
        inPlace.WriteInt64("after", -1);

        EXPECT_EQ(viaCopy.CreateBinary(), inPlace.CreateBinary());
    }
}

TEST(TypedBinaryWriterTest, InPlaceBuffersNestAndTakeTypedEntries) {
    TypedBinaryWriter inner;
    inner.WriteUint16("leaf", 7);
    inner.WriteBuffer("empty", nullptr, 0);
    TypedBinaryWriter expected;
    expected.WriteBuffer("outer", inner.CreateBinary());
    expected.WriteBool("next", false);

    // A nested block written straight into the outer one, by the same writer.
    TypedBinaryWriter inPlace;
    const unsigned int outer = inPlace.BeginBuffer("outer");
    inPlace.WriteUint16("leaf", 7);
    const unsigned int empty = inPlace.BeginBuffer("empty");
    ASSERT_EQ(S_OK, inPlace.EndBuffer(empty));
    ASSERT_EQ(S_OK, inPlace.EndBuffer(outer));
    inPlace.WriteBool("next", false);

    EXPECT_EQ(expected.CreateBinary(), inPlace.CreateBinary());
}

TEST(TypedBinaryWriterTest, EndBufferRefusesMarksOfNoOpenEntry) {
    TypedBinaryWriter writer;
    EXPECT_EQ(E_FAIL, writer.EndBuffer(0));  // empty writer
    writer.WriteInt32("n", 3);
    const unsigned int mark = writer.BeginBuffer("b");
    writer.Raw().WriteUint32(5);
    ASSERT_EQ(S_OK, writer.EndBuffer(mark));
    const unsigned int size = writer.Tell();

    for (unsigned int bad : {mark,                             // already closed
                             TypedBinaryWriter::kInvalidMark,  // BeginBuffer failed
                             size - 3, size, size + 100,       // past the end
                             0u, 6u}) {                        // inside another entry
        SCOPED_TRACE(bad);
        EXPECT_EQ(E_FAIL, writer.EndBuffer(bad));
    }
    EXPECT_EQ(size, writer.Tell());
}

}  // namespace
