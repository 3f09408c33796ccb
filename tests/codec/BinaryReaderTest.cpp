#include <gtest/gtest.h>

#include <functional>
#include <string>

#include "Nimbo/BinaryReader.h"
#include "Nimbo/BinaryWriter.h"
#include "Nimbo/ResultCodes.h"
#include "codec/CodecTestSupport.h"

namespace {

using codec_test::Bytes;
using Nimbo::Binary;
using Nimbo::BinaryReader;
using Nimbo::BinaryWriter;

TEST(BinaryReaderTest, ReadsBackWhatTheWriterWrote) {
    BinaryWriter writer;
    writer.WriteInt32(-123456);
    writer.WriteUint32(0xFFFFFFFFu);
    writer.WriteUint64(0xFEDCBA9876543210ull);
    writer.WriteString("");
    writer.WriteString("na\xc3\xafve");
    writer.WriteBuffer("raw", 3);
    BinaryReader reader(writer.CreateBinary());

    int i32 = 0;
    unsigned int u32 = 0;
    unsigned long long u64 = 0;
    ZelUnicodeString empty = "x", text;
    Binary raw;
    ASSERT_EQ(S_OK, reader.ReadInt32(i32));
    ASSERT_EQ(S_OK, reader.ReadUint32(u32));
    ASSERT_EQ(S_OK, reader.ReadUint64(u64));
    ASSERT_EQ(S_OK, reader.ReadString(empty));
    ASSERT_EQ(S_OK, reader.ReadString(text));
    EXPECT_EQ(30u, reader.Tell());
    EXPECT_EQ(3u, reader.Remaining());
    ASSERT_EQ(S_OK, reader.ReadBinary(reader.Remaining(), raw));
    EXPECT_EQ(0u, reader.Remaining());

    EXPECT_EQ(-123456, i32);
    EXPECT_EQ(0xFFFFFFFFu, u32);
    EXPECT_EQ(0xFEDCBA9876543210ull, u64);
    EXPECT_EQ("", empty);
    EXPECT_EQ("na\xc3\xafve", text);
    EXPECT_TRUE(raw.IsEqual("raw", 3));
}

// Each read fails on the bytes given (after `skip` bytes were read) and must leave its output and
// the position as they were.
struct BadRead {
    const char* what;
    Binary bytes;
    unsigned int skip;
    std::function<long(BinaryReader&)> read;  // stores into a sentinel-holding output
};

TEST(BinaryReaderTest, AFailedReadChangesNeitherOutputNorPosition) {
    static int i32;
    static unsigned int u32;
    static unsigned long long u64;
    static ZelUnicodeString text;
    static Binary raw;
    const Binary sentinel = Bytes({0x5e});
    const BadRead cases[] = {
        {"int32 from 3 bytes", Bytes({1, 2, 3}), 0,
         [](BinaryReader& r) { return r.ReadInt32(i32); }},
        {"uint32 from none", Binary(), 0, [](BinaryReader& r) { return r.ReadUint32(u32); }},
        {"uint64 from 7 bytes", Bytes({1, 2, 3, 4, 5, 6, 7}), 0,
         [](BinaryReader& r) { return r.ReadUint64(u64); }},
        {"string without a whole length", Bytes({1, 0, 0}), 0,
         [](BinaryReader& r) { return r.ReadString(text); }},
        {"string one byte short", Bytes({3, 0, 0, 0, 'a', 'b'}), 0,
         [](BinaryReader& r) { return r.ReadString(text); }},
        {"string of length 2^32-1", Bytes({9, 0xff, 0xff, 0xff, 0xff, 'a'}), 1,
         [](BinaryReader& r) { return r.ReadString(text); }},
        {"raw past the end", Bytes({1, 2, 3}), 1,
         [](BinaryReader& r) { return r.ReadBinary(3, raw); }},
        {"raw of 2^32-1 bytes", Bytes({1, 2, 3}), 2,
         [](BinaryReader& r) { return r.ReadBinary(0xFFFFFFFFu, raw); }},
    };
    for (const BadRead& c : cases) {
        SCOPED_TRACE(c.what);
        i32 = 42;
        u32 = 42;
        u64 = 42;
        text = "kept";
        raw = sentinel;
        BinaryReader reader(c.bytes);
        Binary skipped;
        ASSERT_EQ(S_OK, reader.ReadBinary(c.skip, skipped));
        EXPECT_EQ(E_FAIL, c.read(reader));
        EXPECT_EQ(c.skip, reader.Tell());
        EXPECT_EQ(42, i32);
        EXPECT_EQ(42u, u32);
        EXPECT_EQ(42u, u64);
        EXPECT_EQ("kept", text);
        EXPECT_EQ(sentinel, raw);
    }
}

TEST(BinaryReaderTest, ReadBinaryIsASliceThatOutlivesReaderAndSource) {
    Binary slice;
    const void* sourceData = nullptr;
    {
        Binary source = Bytes({'h', 'e', 'a', 'd', 'b', 'o', 'd', 'y'});
        sourceData = source.GetData();
        BinaryReader reader(source);
        Binary head;
        ASSERT_EQ(S_OK, reader.ReadBinary(4, head));
        ASSERT_EQ(S_OK, reader.ReadBinary(4, slice));
        Binary nothing = Bytes({1});
        ASSERT_EQ(S_OK, reader.ReadBinary(0, nothing));
        EXPECT_TRUE(nothing.IsEmpty());
    }
    // Same memory, no copy, still alive (AddressSanitizer would catch a use after free).
    EXPECT_EQ(static_cast<const char*>(sourceData) + 4, slice.GetData());
    EXPECT_TRUE(slice.IsEqual("body", 4));
}

}  // namespace
