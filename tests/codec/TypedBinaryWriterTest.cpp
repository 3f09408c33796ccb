#include <gtest/gtest.h>

#include <string>

#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "codec/CodecTestSupport.h"

using Nimbo::TypedBinaryWriter;

TEST(TypedBinaryWriterTest, EntryIsTagNameThenPayload) {
    TypedBinaryWriter writer;
    const short values[] = {1, -1};
    ASSERT_EQ(S_OK, writer.WriteInt32("n", -5));
    ASSERT_EQ(S_OK, writer.WriteBool("", true));
    ASSERT_EQ(S_OK, writer.WriteStrings("s", {"ab", ""}));
    ASSERT_EQ(S_OK, writer.WriteArrayInt16("a", values, 2));
    ASSERT_EQ(S_OK, writer.WriteBuffer("b", "xyz", 3));
    // clang-format off
    const Nimbo::Binary expected = Bytes({
        7,  1, 0, 0, 0, 'n', 0xfb, 0xff, 0xff, 0xff,                            // int32
        2,  0, 0, 0, 0, 1,                                                      // bool
        14, 1, 0, 0, 0, 's', 2, 0, 0, 0, 2, 0, 0, 0, 'a', 'b', 0, 0, 0, 0,      // string[]
        18, 1, 0, 0, 0, 'a', 2, 0, 0, 0, 1, 0, 0xff, 0xff,                      // int16[]
        13, 1, 0, 0, 0, 'b', 3, 0, 0, 0, 'x', 'y', 'z'});                       // buffer
    // clang-format on
    EXPECT_EQ(Str(expected), Str(writer.CreateBinary()));
}

// Arrays and buffers need data only when they have elements; sizes past a block are refused
// before any element is read; EndBuffer refuses marks of no open entry. What is refused writes
// nothing.
TEST(TypedBinaryWriterTest, RefusedEntriesWriteNothing) {
    TypedBinaryWriter writer;
    EXPECT_EQ(E_FAIL, writer.EndBuffer(0));  // empty writer
    EXPECT_EQ(S_OK, writer.WriteArrayDouble("d", nullptr, 0));
    EXPECT_EQ(S_OK, writer.WriteBuffer("b", nullptr, 0));
    const unsigned int mark = writer.BeginBuffer("b");
    writer.Raw().WriteUint32(5);
    ASSERT_EQ(S_OK, writer.EndBuffer(mark));
    const unsigned int size = writer.Tell();
    const double one = 1;
    EXPECT_EQ(E_FAIL, writer.WriteArrayDouble("d", nullptr, 1));
    EXPECT_EQ(E_FAIL, writer.WriteArrayBool("b", nullptr, 3));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("b", nullptr, 1));
    EXPECT_EQ(E_FAIL, writer.WriteArrayDouble("d", &one, 0x20000000u));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("b", &one, 0xFFFFFFF0u));
    // Already closed, from a failed BeginBuffer, past the end, inside another entry.
    for (unsigned int bad :
         {mark, TypedBinaryWriter::kInvalidMark, size - 3, size, size + 100, 0u, 6u})
        EXPECT_EQ(E_FAIL, writer.EndBuffer(bad)) << bad;
    EXPECT_EQ(size, writer.Tell());
}

// Whatever is written between BeginBuffer and EndBuffer, raw or typed, nested or not, gives the
// bytes of WriteBuffer with those bytes written apart.
TEST(TypedBinaryWriterTest, InPlaceBufferEqualsWriteBuffer) {
    for (const std::string& raw : {std::string(), std::string("abc"), std::string(5000, 'q')}) {
        SCOPED_TRACE(raw.size());
        const auto size = static_cast<unsigned int>(raw.size());
        TypedBinaryWriter inner;
        inner.Raw().WriteBuffer(raw.data(), size);
        inner.WriteUint16("leaf", 7);
        inner.WriteBuffer("empty", nullptr, 0);
        TypedBinaryWriter apart;
        apart.WriteString("before", "x");
        apart.WriteBuffer("buf", inner.CreateBinary());
        apart.WriteInt64("after", -1);

        TypedBinaryWriter inPlace;
        inPlace.WriteString("before", "x");
        const unsigned int outer = inPlace.BeginBuffer("buf");
        ASSERT_NE(TypedBinaryWriter::kInvalidMark, outer);
        inPlace.Raw().WriteBuffer(raw.data(), size);
        inPlace.WriteUint16("leaf", 7);
        ASSERT_EQ(S_OK, inPlace.EndBuffer(inPlace.BeginBuffer("empty")));
        ASSERT_EQ(S_OK, inPlace.EndBuffer(outer));
        inPlace.WriteInt64("after", -1);
        EXPECT_EQ(Str(apart.CreateBinary()), Str(inPlace.CreateBinary()));
    }
}
