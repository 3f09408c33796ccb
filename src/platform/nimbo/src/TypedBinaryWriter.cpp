// A block of typed entries, built on the plain values of BinaryWriter.cpp (little-endian numbers,
// string := length:uint32 byte[length]):
//
//   block    := entry*                              no header, no count: runs to the end
//   entry    := tag:uint8 name:string payload
//
//   tag  kind       payload
//    1   string     string
//    2   bool       uint8                           0 or 1
//    3   int8       int8
//    4   uint8      uint8
//    5   int16      int16
//    6   uint16     uint16
//    7   int32      int32
//    8   uint32     uint32
//    9   int64      int64
//   10   uint64     uint64
//   11   float      float32                         IEEE 754 bits
//   12   double     float64                         IEEE 754 bits
//   13   buffer     size:uint32 byte[size]
//   14   string[]   count:uint32 string[count]
//   15   bool[]     count:uint32 uint8[count]       one byte per element, as given
//   16   int8[]     count:uint32 int8[count]
//   17   uint8[]    count:uint32 uint8[count]
//   18   int16[]    count:uint32 int16[count]
//   19   uint16[]   count:uint32 uint16[count]
//   20   int32[]    count:uint32 int32[count]
//   21   uint32[]   count:uint32 uint32[count]
//   22   int64[]    count:uint32 int64[count]
//   23   uint64[]   count:uint32 uint64[count]
//   24   float[]    count:uint32 float32[count]
//   25   double[]   count:uint32 float64[count]
//
// Tag 0 and tags above 25 are not entries. Each entry is sized first and appended with one
// Extend, so a failed write leaves nothing behind and no entry costs more than one growth.
#include "Nimbo/TypedBinaryWriter.h"

#include <cstring>
#include <limits>

#include "Nimbo/ResultCodes.h"
#include "TypedEntryTag.h"

namespace Nimbo {

static_assert(std::numeric_limits<float>::is_iec559 && std::numeric_limits<double>::is_iec559,
              "floating-point values travel as their IEEE 754 bits");
static_assert(sizeof(short) == 2 && sizeof(int) == 4 && sizeof(long long) == 8,
              "entries copy numbers at their width in memory");

namespace {

constexpr unsigned long long kMaxBlock = 0xFFFFFFFFull;
// What the length of an open buffer entry holds until EndBuffer: no closed entry can be that long,
// since its header takes bytes of the block too.
constexpr unsigned int kOpenBuffer = 0xFFFFFFFFu;

char* PutUint32(char* at, unsigned int value) {
    std::memcpy(at, &value, sizeof value);
    return at + sizeof value;
}

}  // namespace

TypedBinaryWriter::TypedBinaryWriter(unsigned int initialCapacity) : raw_(initialCapacity) {}

char* TypedBinaryWriter::BeginEntry(TypedEntryTag tag, const ZelUnicodeString& name,
                                    unsigned long long payloadSize) {
    const std::string& text = name.str();
    if (text.size() > kMaxBlock || payloadSize > kMaxBlock) return nullptr;
    char* at = raw_.Extend(1ull + 4ull + text.size() + payloadSize);
    if (at == nullptr) return nullptr;
    *at++ = static_cast<char>(tag);
    at = PutUint32(at, static_cast<unsigned int>(text.size()));
    if (!text.empty()) std::memcpy(at, text.data(), text.size());
    return at + text.size();
}

template <typename T>
long TypedBinaryWriter::WriteScalar(TypedEntryTag tag, const ZelUnicodeString& name, T value) {
    char* at = BeginEntry(tag, name, sizeof value);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, &value, sizeof value);
    return S_OK;
}

template <typename T>
long TypedBinaryWriter::WriteArray(TypedEntryTag tag, const ZelUnicodeString& name, const T* values,
                                   unsigned int count) {
    if (values == nullptr && count > 0) return E_FAIL;
    const unsigned long long bytes = static_cast<unsigned long long>(count) * sizeof(T);
    char* at = BeginEntry(tag, name, 4ull + bytes);
    if (at == nullptr) return E_FAIL;
    at = PutUint32(at, count);
    if (bytes > 0) std::memcpy(at, values, bytes);
    return S_OK;
}

long TypedBinaryWriter::WriteString(const ZelUnicodeString& name, const ZelUnicodeString& value) {
    const std::string& text = value.str();
    if (text.size() > kMaxBlock) return E_FAIL;
    char* at = BeginEntry(TypedEntryTag::kString, name, 4ull + text.size());
    if (at == nullptr) return E_FAIL;
    at = PutUint32(at, static_cast<unsigned int>(text.size()));
    if (!text.empty()) std::memcpy(at, text.data(), text.size());
    return S_OK;
}

long TypedBinaryWriter::WriteBool(const ZelUnicodeString& name, bool value) {
    return WriteScalar<unsigned char>(TypedEntryTag::kBool, name, value ? 1 : 0);
}
long TypedBinaryWriter::WriteInt8(const ZelUnicodeString& name, signed char value) {
    return WriteScalar(TypedEntryTag::kInt8, name, value);
}
long TypedBinaryWriter::WriteUint8(const ZelUnicodeString& name, unsigned char value) {
    return WriteScalar(TypedEntryTag::kUint8, name, value);
}
long TypedBinaryWriter::WriteInt16(const ZelUnicodeString& name, short value) {
    return WriteScalar(TypedEntryTag::kInt16, name, value);
}
long TypedBinaryWriter::WriteUint16(const ZelUnicodeString& name, unsigned short value) {
    return WriteScalar(TypedEntryTag::kUint16, name, value);
}
long TypedBinaryWriter::WriteInt32(const ZelUnicodeString& name, int value) {
    return WriteScalar(TypedEntryTag::kInt32, name, value);
}
long TypedBinaryWriter::WriteUint32(const ZelUnicodeString& name, unsigned int value) {
    return WriteScalar(TypedEntryTag::kUint32, name, value);
}
long TypedBinaryWriter::WriteInt64(const ZelUnicodeString& name, long long value) {
    return WriteScalar(TypedEntryTag::kInt64, name, value);
}
long TypedBinaryWriter::WriteUint64(const ZelUnicodeString& name, unsigned long long value) {
    return WriteScalar(TypedEntryTag::kUint64, name, value);
}
long TypedBinaryWriter::WriteFloat(const ZelUnicodeString& name, float value) {
    return WriteScalar(TypedEntryTag::kFloat, name, value);
}
long TypedBinaryWriter::WriteDouble(const ZelUnicodeString& name, double value) {
    return WriteScalar(TypedEntryTag::kDouble, name, value);
}

long TypedBinaryWriter::WriteBuffer(const ZelUnicodeString& name, const void* data,
                                    unsigned int size) {
    // Laid out as a uint8 array: a byte count, then the bytes.
    return WriteArray(TypedEntryTag::kBuffer, name, static_cast<const unsigned char*>(data), size);
}

long TypedBinaryWriter::WriteBuffer(const ZelUnicodeString& name, const Binary& data) {
    return WriteBuffer(name, data.GetData(), data.GetSize());
}

long TypedBinaryWriter::WriteStrings(const ZelUnicodeString& name,
                                     const std::vector<ZelUnicodeString>& values) {
    if (values.size() > kMaxBlock) return E_FAIL;
    unsigned long long payload = 4;
    for (const ZelUnicodeString& value : values) {
        payload += 4ull + value.str().size();
        if (payload > kMaxBlock) return E_FAIL;
    }
    char* at = BeginEntry(TypedEntryTag::kStrings, name, payload);
    if (at == nullptr) return E_FAIL;
    at = PutUint32(at, static_cast<unsigned int>(values.size()));
    for (const ZelUnicodeString& value : values) {
        const std::string& text = value.str();
        at = PutUint32(at, static_cast<unsigned int>(text.size()));
        if (!text.empty()) std::memcpy(at, text.data(), text.size());
        at += text.size();
    }
    return S_OK;
}

long TypedBinaryWriter::WriteArrayBool(const ZelUnicodeString& name, const unsigned char* values,
                                       unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayBool, name, values, count);
}
long TypedBinaryWriter::WriteArrayInt8(const ZelUnicodeString& name, const signed char* values,
                                       unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayInt8, name, values, count);
}
long TypedBinaryWriter::WriteArrayUint8(const ZelUnicodeString& name, const unsigned char* values,
                                        unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayUint8, name, values, count);
}
long TypedBinaryWriter::WriteArrayInt16(const ZelUnicodeString& name, const short* values,
                                        unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayInt16, name, values, count);
}
long TypedBinaryWriter::WriteArrayUint16(const ZelUnicodeString& name, const unsigned short* values,
                                         unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayUint16, name, values, count);
}
long TypedBinaryWriter::WriteArrayInt32(const ZelUnicodeString& name, const int* values,
                                        unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayInt32, name, values, count);
}
long TypedBinaryWriter::WriteArrayUint32(const ZelUnicodeString& name, const unsigned int* values,
                                         unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayUint32, name, values, count);
}
long TypedBinaryWriter::WriteArrayInt64(const ZelUnicodeString& name, const long long* values,
                                        unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayInt64, name, values, count);
}
long TypedBinaryWriter::WriteArrayUint64(const ZelUnicodeString& name,
                                         const unsigned long long* values, unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayUint64, name, values, count);
}
long TypedBinaryWriter::WriteArrayFloat(const ZelUnicodeString& name, const float* values,
                                        unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayFloat, name, values, count);
}
long TypedBinaryWriter::WriteArrayDouble(const ZelUnicodeString& name, const double* values,
                                         unsigned int count) {
    return WriteArray(TypedEntryTag::kArrayDouble, name, values, count);
}

unsigned int TypedBinaryWriter::BeginBuffer(const ZelUnicodeString& name) {
    char* at = BeginEntry(TypedEntryTag::kBuffer, name, 4);
    if (at == nullptr) return kInvalidMark;
    PutUint32(at, kOpenBuffer);
    return static_cast<unsigned int>(at - raw_.data_);
}

long TypedBinaryWriter::EndBuffer(unsigned int mark) {
    const unsigned long long start = static_cast<unsigned long long>(mark) + 4;
    if (start > raw_.size_) return E_FAIL;
    unsigned int length = 0;
    std::memcpy(&length, raw_.data_ + mark, sizeof length);
    if (length != kOpenBuffer) return E_FAIL;
    PutUint32(raw_.data_ + mark, static_cast<unsigned int>(raw_.size_ - start));
    return S_OK;
}

}  // namespace Nimbo
