#include <gtest/gtest.h>

#include <functional>
#include <string>
#include <tuple>

#include "Nimbo/BinaryReader.h"
#include "Nimbo/BinaryWriter.h"
#include "Nimbo/ResultCodes.h"
#include "codec/CodecTestSupport.h"

namespace {

using Nimbo::Binary;
using Nimbo::BinaryReader;

// What the reader reads into, holding sentinels until then.
struct Values {
    int i32 = 42;
    unsigned int u32 = 42;
    unsigned long long u64 = 42;
    ZelUnicodeString text = "kept", other = "kept";
    Binary raw = Bytes({0x5e});
    auto Tuple() const { return std::make_tuple(i32, u32, u64, text.str(), other.str(), Str(raw)); }
};

// The writer lays values out little-endian, refuses (writing nothing) what does not fit in 2^32-1
// bytes or has no data, hands its bytes over and is then empty and reusable; the reader reads the
// values back.
TEST(BinaryWriterTest, LaysValuesOutLittleEndianAndReadsThemBack) {
    Nimbo::BinaryWriter writer(4);
    EXPECT_TRUE(writer.CreateBinary().IsEmpty());
    ASSERT_EQ(S_OK, writer.WriteInt32(-2));
    ASSERT_EQ(S_OK, writer.WriteUint32(0xFFFFFFFEu));
    ASSERT_EQ(S_OK, writer.WriteUint64(0xF122334455667788ull));
    ASSERT_EQ(S_OK, writer.WriteString("h\xc3\xa9"));
    ASSERT_EQ(S_OK, writer.WriteString(""));
    ASSERT_EQ(S_OK, writer.WriteBuffer("xy", 2));
    ASSERT_EQ(S_OK, writer.WriteBuffer(Bytes({0x7a})));
    ASSERT_EQ(S_OK, writer.WriteBuffer(nullptr, 0));
    EXPECT_EQ(E_FAIL, writer.Reserve(0xFFFFFFFFu));
    EXPECT_EQ(E_FAIL, writer.WriteBuffer("x", 0xFFFFFFF0u));  // "x" is not read: sized first
    EXPECT_EQ(E_FAIL, writer.WriteBuffer(nullptr, 1));
    EXPECT_EQ(30u, writer.Tell());
    const Binary written = writer.CreateBinary();
    EXPECT_EQ(0u, writer.Tell());
    ASSERT_EQ(S_OK, writer.WriteUint32(9));
    EXPECT_EQ(Str(Bytes({9, 0, 0, 0})), Str(writer.CreateBinary()));
    // clang-format off
    EXPECT_EQ(Str(Bytes({0xfe, 0xff, 0xff, 0xff,  0xfe, 0xff, 0xff, 0xff,
                         0x88, 0x77, 0x66, 0x55, 0x44, 0x33, 0x22, 0xf1,
                         3, 0, 0, 0, 'h', 0xc3, 0xa9,  0, 0, 0, 0,  'x', 'y', 'z'})),
              Str(written));
    // clang-format on

    BinaryReader reader(written);
    Values in;
    ASSERT_EQ(S_OK, reader.ReadInt32(in.i32));
    ASSERT_EQ(S_OK, reader.ReadUint32(in.u32));
    ASSERT_EQ(S_OK, reader.ReadUint64(in.u64));
    ASSERT_EQ(S_OK, reader.ReadString(in.text));
    ASSERT_EQ(S_OK, reader.ReadString(in.other));
    EXPECT_EQ(27u, reader.Tell());
    ASSERT_EQ(S_OK, reader.ReadBinary(3, in.raw));
    EXPECT_EQ(0u, reader.Remaining());
    EXPECT_EQ(std::make_tuple(-2, 0xFFFFFFFEu, 0xF122334455667788ull, std::string("h\xc3\xa9"),
                              std::string(), std::string("xyz")),
              in.Tuple());
    // The raw bytes are a slice of the block, not a copy; reading none gives an empty block.
    EXPECT_EQ(static_cast<const char*>(written.GetData()) + 27, in.raw.GetData());
    ASSERT_EQ(S_OK, reader.ReadBinary(0, in.raw));
    EXPECT_TRUE(in.raw.IsEmpty());
}

// Each read fails on the bytes given (after `skip` bytes were read) and leaves every output and
// the position as they were.
TEST(BinaryReaderTest, AFailedReadChangesNeitherOutputNorPosition) {
#define READ(call) [](BinaryReader& r, Values& v) { return r.call; }
    const std::tuple<const char*, Binary, unsigned int, std::function<long(BinaryReader&, Values&)>>
        cases[] = {
            {"int32 from 3 bytes", Bytes({1, 2, 3}), 0, READ(ReadInt32(v.i32))},
            {"uint32 from none", Binary(), 0, READ(ReadUint32(v.u32))},
            {"uint64 from 7 bytes", Bytes({1, 2, 3, 4, 5, 6, 7}), 0, READ(ReadUint64(v.u64))},
            {"string without a whole length", Bytes({1, 0, 0}), 0, READ(ReadString(v.text))},
            {"string one byte short", Bytes({3, 0, 0, 0, 'a', 'b'}), 0, READ(ReadString(v.text))},
            {"string of length 2^32-1", Bytes({9, 255, 255, 255, 255, 'a'}), 1,
             READ(ReadString(v.text))},
            {"raw past the end", Bytes({1, 2, 3}), 1, READ(ReadBinary(3, v.raw))},
            {"raw of 2^32-1 bytes", Bytes({1, 2, 3}), 2, READ(ReadBinary(0xFFFFFFFFu, v.raw))},
        };
#undef READ
    for (const auto& [what, bytes, skip, read] : cases) {
        SCOPED_TRACE(what);
        Values out;
        BinaryReader reader(bytes);
        ASSERT_EQ(S_OK, reader.ReadBinary(skip, out.raw));
        out.raw = Bytes({0x5e});
        EXPECT_EQ(E_FAIL, read(reader, out));
        EXPECT_EQ(skip, reader.Tell());
        EXPECT_EQ(Values().Tuple(), out.Tuple());
    }
}

}  // namespace
