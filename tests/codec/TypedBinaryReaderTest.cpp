#include <gtest/gtest.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <string>
#include <tuple>
#include <vector>

#include "Nimbo/BinaryWriter.h"
#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryReader.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "codec/CodecTestSupport.h"

// The reader allocates arrays with nothrow new[]; recording the largest request lets the tests
// check that no count is believed before it was checked against the bytes.
static std::size_t largestArrayAllocation = 0;

void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
    if (size > largestArrayAllocation) largestArrayAllocation = size;
    try {
        return ::operator new[](size);
    } catch (...) {
        return nullptr;
    }
}

namespace {

using Nimbo::Binary;
using Nimbo::TypedBinaryReader;
using Nimbo::TypedBinaryWriter;
using Strings = std::vector<std::string>;

// One entry of every kind, with the extremes of each type and floating-point values whose bits
// must survive (-0, NaN payloads, a denormal); `ends` receives where the block ends after each.
Binary WriteEveryKind(std::vector<unsigned int>& ends) {
    TypedBinaryWriter w;
    using F = std::numeric_limits<float>;
    using D = std::numeric_limits<double>;
    using L = std::numeric_limits<long long>;
    // clang-format off
    auto done = [&](long result) { EXPECT_EQ(S_OK, result); ends.push_back(w.Tell()); };
    const unsigned char bools[] = {1, 0, 7}, u8[] = {0, 255}; const signed char i8[] = {-128, 127};
    const short i16[] = {-32768, 32767}; const unsigned short u16[] = {65535};
    const int i32[] = {-2147483647 - 1, -1, 0}; const unsigned int u32[] = {0xFFFFFFFFu};
    const long long i64[] = {L::min()}; const unsigned long long u64[] = {~0ULL, 1};
    const float f[] = {0.5f, -0.0f, F::quiet_NaN(), F::infinity()};
    const double d[] = {0.25, -0.0, std::nan("0x5"), D::denorm_min()};
    done(w.WriteString("s", "h\xc3\xa9llo")); done(w.WriteString("", ""));
    done(w.WriteBool("t", true)); done(w.WriteBool("f", false)); done(w.WriteInt8("i8", -128));
    done(w.WriteUint8("u8", 255)); done(w.WriteInt16("i16", -32768));
    done(w.WriteUint16("u16", 65535)); done(w.WriteInt32("i32", -2147483647 - 1));
    done(w.WriteUint32("u32", 0xFFFFFFFFu)); done(w.WriteInt64("i64", L::min()));
    done(w.WriteUint64("u64", ~0ULL)); done(w.WriteFloat("fl", 1.5f));
    done(w.WriteFloat("sn", F::signaling_NaN())); done(w.WriteDouble("db", -2.25));
    done(w.WriteDouble("nz", -0.0)); done(w.WriteBuffer("nobuf", Binary()));
    done(w.WriteBuffer("buf", "bytes", 5)); done(w.WriteStrings("ss", {"a", "", "b\xc3\xa9"}));
    done(w.WriteStrings("noss", {})); done(w.WriteArrayBool("ab", bools, 3));
    done(w.WriteArrayInt8("ai8", i8, 2)); done(w.WriteArrayUint8("au8", u8, 2));
    done(w.WriteArrayInt16("ai16", i16, 2)); done(w.WriteArrayUint16("au16", u16, 1));
    done(w.WriteArrayInt32("ai32", i32, 3)); done(w.WriteArrayUint32("au32", u32, 1));
    done(w.WriteArrayInt64("ai64", i64, 1)); done(w.WriteArrayUint64("au64", u64, 2));
    done(w.WriteArrayFloat("af", f, 4)); done(w.WriteArrayDouble("ad", d, 4));
    done(w.WriteArrayInt32("none", nullptr, 0));
    // clang-format on
    return w.CreateBinary();
}

// clang-format off
const Strings kEveryKindLines = {
    "string s='h\xc3\xa9llo'", "string =''", "bool t=true", "bool f=false", "int8 i8=-128",
    "uint8 u8=255", "int16 i16=-32768", "uint16 u16=65535", "int32 i32=-2147483648",
    "uint32 u32=4294967295", "int64 i64=-9223372036854775808", "uint64 u64=18446744073709551615",
    "float fl=1.5", "float sn=nan", "double db=-2.25", "double nz=-0", "buffer nobuf=''",
    "buffer buf='bytes'", "string[] ss=['a','','b\xc3\xa9']", "string[] noss=[]",
    "bool[] ab=[1,0,7]", "int8[] ai8=[-128,127]", "uint8[] au8=[0,255]",
    "int16[] ai16=[-32768,32767]", "uint16[] au16=[65535]", "int32[] ai32=[-2147483648,-1,0]",
    "uint32[] au32=[4294967295]", "int64[] ai64=[-9223372036854775808]",
    "uint64[] au64=[18446744073709551615,1]", "float[] af=[0.5,-0,nan,inf]",
    "double[] ad=[0.25,-0,nan,4.9406564584124654e-324]", "int32[] none=null"};
// clang-format on

// Every entry comes back in the order written, and writing back what was read gives the same
// bytes. A handler refusing an entry stops the walk (the arrays it refuses are still released).
// Apply leaves the reader as it was, and buffer entries are slices of the block, which they keep
// alive.
TEST(TypedBinaryReaderTest, HandsEveryEntryBackUntilAHandlerRefusesOne) {
    const int kEntries = static_cast<int>(kEveryKindLines.size());
    Binary buffer;
    {
        std::vector<unsigned int> ends;
        const Binary block = WriteEveryKind(ends);
        const TypedBinaryReader reader(block);
        // The kind tags are part of the byte layout: each entry starts with its own.
        const int kTags[] = {1,  1,  2,  2,  3,  4,  5,  6,  7,  8,  9,  10, 11, 11, 12, 12,
                             13, 13, 14, 14, 15, 16, 17, 18, 19, 20, 21, 22, 23, 24, 25, 20};
        for (int i = 0; i < kEntries; ++i)
            EXPECT_EQ(kTags[i], 0xff & Str(block)[i ? ends[i - 1] : 0]) << kEveryKindLines[i];
        for (int refuse = -1; refuse < kEntries; ++refuse) {
            SCOPED_TRACE(refuse);
            TypedBinaryWriter again;
            Recorder recorder(refuse, refuse < 0 ? &again : nullptr);
            largestArrayAllocation = 0;
            EXPECT_EQ(refuse < 0 ? S_OK : E_FAIL, reader.Apply(recorder));
            const int seen = refuse < 0 ? kEntries : refuse + 1;
            EXPECT_EQ(Strings(kEveryKindLines.begin(), kEveryKindLines.begin() + seen),
                      recorder.lines);
            // The hook above sees the reader's arrays, the largest being 4 doubles.
            EXPECT_TRUE(refuse != kEntries - 1 || largestArrayAllocation == 32u);
            if (refuse >= 0) continue;
            EXPECT_EQ(Str(block), Str(again.CreateBinary()));
            buffer = recorder.buffer;
        }
        EXPECT_EQ(static_cast<const char*>(block.GetData()) + ends[17] - 5, buffer.GetData());
    }
    EXPECT_EQ("bytes", Str(buffer));
}

// Cut after any byte, a block hands back its whole entries and then fails, unless the cut falls
// between entries; with any byte changed it neither crashes nor allocates an array larger than
// the block.
TEST(TypedBinaryReaderTest, TruncatedOrCorruptedBlocksFailSafely) {
    std::vector<unsigned int> ends;
    const Binary block = WriteEveryKind(ends);
    const auto* original = static_cast<const unsigned char*>(block.GetData());
    const unsigned int size = block.GetSize();
    ASSERT_EQ(size, ends.back());
    std::vector<unsigned char> bytes(original, original + size);
    for (unsigned int at = 0; at <= size; ++at) {
        SCOPED_TRACE(at);
        size_t whole = 0;
        while (whole < ends.size() && ends[whole] <= at) ++whole;
        Recorder recorder;
        EXPECT_EQ(at == 0 || (whole > 0 && ends[whole - 1] == at) ? S_OK : E_FAIL,
                  TypedBinaryReader(Copy(original, at)).Apply(recorder));
        EXPECT_EQ(Strings(kEveryKindLines.begin(), kEveryKindLines.begin() + whole),
                  recorder.lines);
        if (at == size) break;
        for (int change : {0x00, 0xff, 0x7f, original[at] ^ 0x01, original[at] ^ 0x80}) {
            bytes[at] = static_cast<unsigned char>(change);
            largestArrayAllocation = 0;
            Recorder corrupted;
            TypedBinaryReader(Copy(bytes.data(), size)).Apply(corrupted);
            ASSERT_LE(largestArrayAllocation, size) << "set to " << change;
        }
        bytes[at] = original[at];
    }
}

TEST(TypedBinaryReaderTest, CountsPastTheEndFailBeforeAnythingIsAllocated) {
    // A block of one entry: tag, name (none: `count` is then the name's length), count, `rest`.
    auto check = [](unsigned char tag, unsigned int count, const std::string& rest, bool named) {
        SCOPED_TRACE(std::to_string(tag) + " " + std::to_string(count));
        Nimbo::BinaryWriter w;
        w.WriteBuffer(&tag, 1);
        if (named) w.WriteString("x");
        w.WriteUint32(count);
        w.WriteBuffer(rest.data(), static_cast<unsigned int>(rest.size()));
        largestArrayAllocation = 0;
        Recorder recorder;
        EXPECT_EQ(E_FAIL, TypedBinaryReader(w.CreateBinary()).Apply(recorder));
        EXPECT_TRUE(recorder.lines.empty());
        EXPECT_EQ(0u, largestArrayAllocation);
    };
    // Array counts claiming everything, one element more than there is, and counts whose byte
    // size wraps around 2^32.
    const unsigned int elementSizes[] = {1, 1, 1, 2, 2, 4, 4, 8, 8, 4, 8};  // tags 15 to 25
    for (unsigned char tag = 15; tag <= 25; ++tag) {
        const unsigned int size = elementSizes[tag - 15];
        for (unsigned int count :
             {0xFFFFFFFFu, 4u, static_cast<unsigned int>(0x100000000ull / size)})
            if (count > 0) check(tag, count, std::string(3 * size, '\0'), true);
    }
    // Two empty strings where more are claimed, a buffer and a name of 2^32-1 bytes.
    for (unsigned int count : {0xFFFFFFFFu, 0x40000000u, 3u})
        check(14, count, std::string(8, '\0'), true);
    check(13, 0xFFFFFFFFu, std::string(8, '\0'), true);
    check(7, 0xFFFFFFFFu, std::string(8, '\0'), false);
}

// An entry "x" of the tag given, with a payload byte unless -1, between two valid entries: the walk
// stops at it unless it is a bool of 0 or 1.
TEST(TypedBinaryReaderTest, UnknownTagsAndBadBoolsStopTheWalk) {
    const std::tuple<int, int, const char*> cases[] = {
        {2, 0, "bool x=false"}, {2, 1, "bool x=true"}, {2, 2, nullptr},     {2, 0xff, nullptr},
        {0, -1, nullptr},       {26, -1, nullptr},     {0x80, -1, nullptr}, {0xff, -1, nullptr}};
    for (const auto& [tag, payload, line] : cases) {
        SCOPED_TRACE(tag * 1000 + payload);
        std::string bytes("\x07\x01\0\0\0n\x01\0\0\0", 10);  // int32 n=1
        bytes += std::string{static_cast<char>(tag), 1, 0, 0, 0, 'x'};
        if (payload >= 0) bytes += static_cast<char>(payload);
        bytes += std::string("\x02\x01\0\0\0y\x01", 7);  // bool y=true
        Recorder recorder;
        EXPECT_EQ(line ? S_OK : E_FAIL,
                  TypedBinaryReader(Copy(bytes.data(), bytes.size())).Apply(recorder));
        EXPECT_EQ((line ? Strings{"int32 n=1", line, "bool y=true"} : Strings{"int32 n=1"}),
                  recorder.lines);
    }
}

}  // namespace
