#include <gtest/gtest.h>

#include "Nimbo/BinaryWriter.h"
#include "Nimbo/ResultCodes.h"
#include "codec/CodecTestSupport.h"

namespace {

using codec_test::Bytes;
using codec_test::Hex;
using Nimbo::Binary;
using Nimbo::BinaryWriter;

TEST(BinaryWriterTest, LaysValuesOutLittleEndianWithLengthPrefixedStrings) {
    BinaryWriter writer;
    ASSERT_EQ(S_OK, writer.WriteInt32(-2));
    ASSERT_EQ(S_OK, writer.WriteUint32(0x01020304u));
    ASSERT_EQ(S_OK, writer.WriteUint64(0x1122334455667788ull));
    ASSERT_EQ(S_OK, writer.WriteString("h\xc3\xa9"));
    ASSERT_EQ(S_OK, writer.WriteString(""));
    ASSERT_EQ(S_OK, writer.WriteBuffer("xy", 2));
    ASSERT_EQ(S_OK, writer.WriteBuffer(Bytes({0x7a})));
    EXPECT_EQ(30u, writer.Tell());

    // clang-format off
    const Binary expected = Bytes({0xfe, 0xff, 0xff, 0xff,                          // int32 -2
                                   0x04, 0x03, 0x02, 0x01,                          // uint32
                                   0x88, 0x77, 0x66, 0x55, 0x44, 0x33, 0x22, 0x11,  // uint64
                                   0x03, 0, 0, 0, 'h', 0xc3, 0xa9,                  // "hé"
                                   0x00, 0, 0, 0,                                   // ""
                                   'x', 'y', 'z'});                                 // raw
    // clang-format on
    const Binary written = writer.CreateBinary();
    EXPECT_EQ(expected, written) << Hex(written);
}

TEST(BinaryWriterTest, CreateBinaryHandsTheBytesOverAndLeavesTheWriterEmpty) {
    BinaryWriter writer(4);
    EXPECT_TRUE(writer.CreateBinary().IsEmpty());

    ASSERT_EQ(S_OK, writer.WriteUint32(7));
    const Binary first = writer.CreateBinary();
    EXPECT_EQ(0u, writer.Tell());
    EXPECT_TRUE(writer.CreateBinary().IsEmpty());

    // The writer is reusable, and the first block is not disturbed by it.
    ASSERT_EQ(S_OK, writer.WriteUint32(9));
    EXPECT_EQ(Bytes({9, 0, 0, 0}), writer.CreateBinary());
    EXPECT_EQ(Bytes({7, 0, 0, 0}), first);
}

TEST(BinaryWriterTest, AWriteThatCannotBeMadeWritesNothing) {
    BinaryWriter writer;
    ASSERT_EQ(S_OK, writer.WriteInt32(1));
    EXPECT_EQ(E_FAIL, writer.Reserve(0xFFFFFFFFu));
    // Past 2^32 - 1 bytes in all; "x" is never read, the size is checked first.
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("x", 0xFFFFFFFDu));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer(nullptr, 1));  // bytes without data
    EXPECT_EQ(4u, writer.Tell());
    EXPECT_EQ(Bytes({1, 0, 0, 0}), writer.CreateBinary());
}

}  // namespace
