#include <gtest/gtest.h>

#include <cmath>
#include <cstddef>
#include <limits>
#include <new>
#include <string>
#include <vector>

#include "Nimbo/BinaryWriter.h"
#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryReader.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "codec/CodecTestSupport.h"

// The reader allocates arrays with nothrow new[]; recording the largest request lets the tests
// check that no count is believed before it was checked against the bytes.
namespace {
std::size_t largestArrayAllocation = 0;
}  // namespace

void* operator new[](std::size_t size, const std::nothrow_t&) noexcept {
    if (size > largestArrayAllocation) largestArrayAllocation = size;
    try {
        return ::operator new[](size);
    } catch (...) {
        return nullptr;
    }
}

namespace {

using codec_test::Bytes;
using codec_test::Copy;
using codec_test::Hex;
using codec_test::Prefix;
using codec_test::Recorder;
using codec_test::Reencoder;
using Nimbo::Binary;
using Nimbo::BinaryWriter;
using Nimbo::TypedBinaryReader;
using Nimbo::TypedBinaryWriter;
using Strings = std::vector<std::string>;

// One entry of every kind, with the extremes of each type, and where the block ends after each.
struct EveryKind {
    Binary block;
    std::vector<unsigned int> ends;
};

EveryKind WriteEveryKind() {
    TypedBinaryWriter w;
    std::vector<unsigned int> ends;
    auto done = [&](long result) {
        EXPECT_EQ(S_OK, result);
        ends.push_back(w.Tell());
    };
    const unsigned char bools[] = {1, 0, 7};
    const signed char i8[] = {-128, 127};
    const unsigned char u8[] = {0, 255};
    const short i16[] = {-32768, 32767};
    const unsigned short u16[] = {65535};
    const int i32[] = {std::numeric_limits<int>::min(), -1, 0};
    const unsigned int u32[] = {0xFFFFFFFFu};
    const long long i64[] = {std::numeric_limits<long long>::min()};
    const unsigned long long u64[] = {0xFFFFFFFFFFFFFFFFull, 1};
    const float f[] = {0.5f, -1.0f};
    const double d[] = {0.25, 1024};
    done(w.WriteString("s", "h\xc3\xa9llo"));
    done(w.WriteString("", ""));
    done(w.WriteBool("t", true));
    done(w.WriteBool("f", false));
    done(w.WriteInt8("i8", -128));
    done(w.WriteUint8("u8", 255));
    done(w.WriteInt16("i16", -32768));
    done(w.WriteUint16("u16", 65535));
    done(w.WriteInt32("i32", std::numeric_limits<int>::min()));
    done(w.WriteUint32("u32", 0xFFFFFFFFu));
    done(w.WriteInt64("i64", std::numeric_limits<long long>::min()));
    done(w.WriteUint64("u64", 0xFFFFFFFFFFFFFFFFull));
    done(w.WriteFloat("fl", 1.5f));
    done(w.WriteDouble("db", -2.25));
    done(w.WriteBuffer("buf", "bytes", 5));
    done(w.WriteBuffer("nobuf", Binary()));
    done(w.WriteStrings("ss", {"a", "", "b\xc3\xa9"}));
    done(w.WriteStrings("noss", {}));
    done(w.WriteArrayBool("ab", bools, 3));
    done(w.WriteArrayInt8("ai8", i8, 2));
    done(w.WriteArrayUint8("au8", u8, 2));
    done(w.WriteArrayInt16("ai16", i16, 2));
    done(w.WriteArrayUint16("au16", u16, 1));
    done(w.WriteArrayInt32("ai32", i32, 3));
    done(w.WriteArrayUint32("au32", u32, 1));
    done(w.WriteArrayInt64("ai64", i64, 1));
    done(w.WriteArrayUint64("au64", u64, 2));
    done(w.WriteArrayFloat("af", f, 2));
    done(w.WriteArrayDouble("ad", d, 2));
    done(w.WriteArrayInt32("none32", nullptr, 0));
    done(w.WriteArrayBool("nobool", nullptr, 0));
    done(w.WriteArrayDouble("nodouble", nullptr, 0));
    return {w.CreateBinary(), ends};
}

const Strings kEveryKindLines = {
    "string s='h\xc3\xa9llo'",
    "string =''",
    "bool t=true",
    "bool f=false",
    "int8 i8=-128",
    "uint8 u8=255",
    "int16 i16=-32768",
    "uint16 u16=65535",
    "int32 i32=-2147483648",
    "uint32 u32=4294967295",
    "int64 i64=-9223372036854775808",
    "uint64 u64=18446744073709551615",
    "float fl=1.5",
    "double db=-2.25",
    "buffer buf='bytes'",
    "buffer nobuf=''",
    "string[] ss=['a','','b\xc3\xa9']",
    "string[] noss=[]",
    "bool[] ab=[1,0,7]",
    "int8[] ai8=[-128,127]",
    "uint8[] au8=[0,255]",
    "int16[] ai16=[-32768,32767]",
    "uint16[] au16=[65535]",
    "int32[] ai32=[-2147483648,-1,0]",
    "uint32[] au32=[4294967295]",
    "int64[] ai64=[-9223372036854775808]",
    "uint64[] au64=[18446744073709551615,1]",
    "float[] af=[0.5,-1]",
    "double[] ad=[0.25,1024]",
    "int32[] none32=null",
    "bool[] nobool=null",
    "double[] nodouble=null",
};

TEST(TypedBinaryReaderTest, HandsEveryKindBackInTheOrderWritten) {
    const EveryKind written = WriteEveryKind();
    const TypedBinaryReader reader(written.block);
    for (int pass = 0; pass < 2; ++pass) {  // Apply leaves the reader as it was
        Recorder recorder;
        EXPECT_EQ(S_OK, reader.Apply(recorder));
        EXPECT_EQ(kEveryKindLines, recorder.lines);
    }
}

TEST(TypedBinaryReaderTest, WritingBackWhatWasReadGivesTheSameBytes) {
    TypedBinaryWriter w;
    const float floats[] = {-0.0f, std::numeric_limits<float>::quiet_NaN(),
                            std::numeric_limits<float>::infinity()};
    const double doubles[] = {-0.0, std::nan("0x5"), std::numeric_limits<double>::denorm_min()};
    w.WriteFloat("nan", std::numeric_limits<float>::signaling_NaN());
    w.WriteDouble("neg", -0.0);
    w.WriteArrayFloat("f", floats, 3);
    w.WriteArrayDouble("d", doubles, 3);
    const Binary oddFloats = w.CreateBinary();

    for (const Binary& block : {WriteEveryKind().block, oddFloats, Binary()}) {
        Reencoder reencoder;
        EXPECT_EQ(S_OK, TypedBinaryReader(block).Apply(reencoder));
        const Binary again = reencoder.out.CreateBinary();
        EXPECT_EQ(block, again) << Hex(block) << "\n" << Hex(again);
    }
}

TEST(TypedBinaryReaderTest, BufferEntriesAreSlicesOfTheBlock) {
    class KeepBuffer : public Recorder {
    public:
        Binary kept;
        bool OnBuffer(const ZelUnicodeString& name, const Binary& value) override {
            kept = value;
            return Recorder::OnBuffer(name, value);
        }
    };
    KeepBuffer visitor;
    const char* blockStart = nullptr;
    {
        TypedBinaryWriter w;
        w.WriteInt32("before", 1);
        w.WriteBuffer("b", "payload", 7);
        const Binary block = w.CreateBinary();
        blockStart = static_cast<const char*>(block.GetData());
        ASSERT_EQ(S_OK, TypedBinaryReader(block).Apply(visitor));
    }
    // Points into the block (15 bytes of int32 entry, then tag, name "b" and size), which the
    // slice keeps alive once reader and block are gone.
    EXPECT_EQ(blockStart + 15 + 1 + 5 + 4, visitor.kept.GetData());
    EXPECT_TRUE(visitor.kept.IsEqual("payload", 7));
}

TEST(TypedBinaryReaderTest, ATruncatedBlockFailsAfterTheWholeEntries) {
    const EveryKind written = WriteEveryKind();
    const unsigned int size = written.block.GetSize();
    ASSERT_EQ(size, written.ends.back());
    for (unsigned int length = 0; length <= size; ++length) {
        SCOPED_TRACE(length);
        size_t whole = 0;
        while (whole < written.ends.size() && written.ends[whole] <= length) ++whole;
        const bool atBoundary = length == 0 || (whole > 0 && written.ends[whole - 1] == length);

        Recorder recorder;
        EXPECT_EQ(atBoundary ? S_OK : E_FAIL,
                  TypedBinaryReader(Prefix(written.block, length)).Apply(recorder));
        EXPECT_EQ(Strings(kEveryKindLines.begin(), kEveryKindLines.begin() + whole),
                  recorder.lines);
    }
}

// An entry header: tag, then name.
BinaryWriter& Entry(BinaryWriter& w, unsigned char tag, const char* name = "x") {
    w.WriteBuffer(&tag, 1);
    w.WriteString(name);
    return w;
}

struct CountCase {
    unsigned char tag;
    unsigned int elementSize;
};

TEST(TypedBinaryReaderTest, CountsPastTheEndFailBeforeAnythingIsAllocated) {
    // The hook above must see the reader's arrays for this test to mean anything.
    {
        const int values[1000] = {};
        TypedBinaryWriter w;
        w.WriteArrayInt32("ok", values, 1000);
        largestArrayAllocation = 0;
        Recorder recorder;
        ASSERT_EQ(S_OK, TypedBinaryReader(w.CreateBinary()).Apply(recorder));
        ASSERT_EQ(4000u, largestArrayAllocation);
    }

    const CountCase arrays[] = {{15, 1}, {16, 1}, {17, 1}, {18, 2}, {19, 2}, {20, 4},
                                {21, 4}, {22, 8}, {23, 8}, {24, 4}, {25, 8}};
    std::vector<std::pair<std::string, Binary>> blocks;
    for (const CountCase& c : arrays) {
        const std::string tag = "tag " + std::to_string(c.tag);
        // Counts claiming everything, one element more than there is, and counts whose byte
        // size wraps around 2^32.
        std::vector<unsigned int> counts = {0xFFFFFFFFu, 4};
        if (c.elementSize > 1)
            counts.push_back(static_cast<unsigned int>(0x100000000ull / c.elementSize));
        for (unsigned int count : counts) {
            BinaryWriter w;
            Entry(w, c.tag).WriteUint32(count);
            const char elements[24] = {};
            w.WriteBuffer(elements, 3 * c.elementSize);
            blocks.emplace_back(tag + " count " + std::to_string(count), w.CreateBinary());
        }
    }
    for (unsigned int count : {0xFFFFFFFFu, 0x40000000u, 3u}) {
        BinaryWriter w;
        Entry(w, 14).WriteUint32(count);
        w.WriteString("");
        w.WriteString("");  // two strings where `count` are claimed
        blocks.emplace_back("strings count " + std::to_string(count), w.CreateBinary());
    }
    {
        BinaryWriter w;
        Entry(w, 13).WriteUint32(0xFFFFFFFFu);
        w.WriteUint64(0);
        blocks.emplace_back("buffer of 2^32-1 bytes", w.CreateBinary());
    }
    {
        BinaryWriter w;
        unsigned char tag = 7;
        w.WriteBuffer(&tag, 1);
        w.WriteUint32(0xFFFFFFFFu);
        w.WriteUint64(0);
        blocks.emplace_back("name of 2^32-1 bytes", w.CreateBinary());
    }

    for (const auto& [what, block] : blocks) {
        SCOPED_TRACE(what);
        largestArrayAllocation = 0;
        Recorder recorder;
        EXPECT_EQ(E_FAIL, TypedBinaryReader(block).Apply(recorder));
        EXPECT_TRUE(recorder.lines.empty());
        EXPECT_EQ(0u, largestArrayAllocation);
    }
}

TEST(TypedBinaryReaderTest, UnknownTagsAndBadBoolsStopTheWalk) {
    struct Case {
        unsigned char tag;
        unsigned char payload;
        long result;
        const char* line;  // of the second entry, when it is read
    };
    const Case cases[] = {
        {2, 0, S_OK, "bool x=false"}, {2, 1, S_OK, "bool x=true"}, {2, 2, E_FAIL, nullptr},
        {2, 0xff, E_FAIL, nullptr},   {0, 0, E_FAIL, nullptr},     {26, 0, E_FAIL, nullptr},
        {0x80, 0, E_FAIL, nullptr},   {0xff, 0, E_FAIL, nullptr},
    };
    for (const Case& c : cases) {
        SCOPED_TRACE(static_cast<int>(c.tag) * 1000 + c.payload);
        BinaryWriter w;
        Entry(w, 7, "first").WriteInt32(1);
        Entry(w, c.tag).WriteBuffer(&c.payload, 1);
        Recorder recorder;
        EXPECT_EQ(c.result, TypedBinaryReader(w.CreateBinary()).Apply(recorder));
        Strings expected = {"int32 first=1"};
        if (c.line != nullptr) expected.push_back(c.line);
        EXPECT_EQ(expected, recorder.lines);
    }
}

TEST(TypedBinaryReaderTest, AHandlerRefusingAnEntryStopsTheWalk) {
    const Binary block = WriteEveryKind().block;
    for (int refuse = 0; refuse < static_cast<int>(kEveryKindLines.size()); ++refuse) {
        SCOPED_TRACE(kEveryKindLines[refuse]);
        Recorder recorder;  // releases the arrays it refuses too
        recorder.refuseAt = refuse;
        EXPECT_EQ(E_FAIL, TypedBinaryReader(block).Apply(recorder));
        EXPECT_EQ(static_cast<size_t>(refuse) + 1, recorder.lines.size());
    }
}

TEST(TypedBinaryReaderTest, CorruptingAnyByteNeitherCrashesNorOverAllocates) {
    const Binary block = WriteEveryKind().block;
    const auto* original = static_cast<const unsigned char*>(block.GetData());
    const unsigned int size = block.GetSize();
    std::vector<unsigned char> bytes(original, original + size);
    for (unsigned int at = 0; at < size; ++at) {
        for (int change : {0x00, 0xff, 0x7f, original[at] ^ 0x01, original[at] ^ 0x80}) {
            bytes[at] = static_cast<unsigned char>(change);
            largestArrayAllocation = 0;
            Recorder recorder;
            TypedBinaryReader(Copy(bytes.data(), size)).Apply(recorder);
            ASSERT_LE(largestArrayAllocation, size) << "byte " << at << " set to " << change;
        }
        bytes[at] = original[at];
    }
}

}  // namespace
