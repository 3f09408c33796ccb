// The plain values written here, little-endian, with no padding and no alignment:
//
//   int32   := 4 bytes, two's complement
//   uint32  := 4 bytes
//   uint64  := 8 bytes
//   string  := length:uint32 byte[length]      UTF-8, no terminator
//   raw(n)  := byte[n]                         WriteBuffer; the reader is told n
//
// Numbers are copied straight from memory, which is their wire form on a little-endian host.
#include "Nimbo/BinaryWriter.h"

#include <cstring>
#include <new>

#include "Nimbo/ResultCodes.h"

namespace Nimbo {

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
              "the writers copy numbers from memory and need a little-endian host");

namespace {

constexpr unsigned long long kMaxSize = 0xFFFFFFFFull;
constexpr unsigned long long kMinGrowth = 64;

}  // namespace

BinaryWriter::BinaryWriter(unsigned int initialCapacity) {
    if (initialCapacity > 0) Grow(initialCapacity);
}

BinaryWriter::~BinaryWriter() { delete[] data_; }

bool BinaryWriter::Grow(unsigned long long needed) {
    if (needed <= capacity_) return true;
    if (needed > kMaxSize) return false;
    unsigned long long capacity = 2ull * capacity_;
    if (capacity < kMinGrowth) capacity = kMinGrowth;
    if (capacity < needed) capacity = needed;
    if (capacity > kMaxSize) capacity = kMaxSize;
    char* data = new (std::nothrow) char[capacity];
    if (data == nullptr) return false;
    if (size_ > 0) std::memcpy(data, data_, size_);
    delete[] data_;
    data_ = data;
    capacity_ = static_cast<unsigned int>(capacity);
    return true;
}

char* BinaryWriter::Extend(unsigned long long size) {
    if (size > kMaxSize - size_) return nullptr;
    if (!Grow(size_ + size)) return nullptr;
    char* at = data_ + size_;
    size_ += static_cast<unsigned int>(size);
    return at;
}

long BinaryWriter::Reserve(unsigned int additional) {
    return Grow(static_cast<unsigned long long>(size_) + additional) ? S_OK : E_FAIL;
}

long BinaryWriter::WriteInt32(int value) {
    char* at = Extend(sizeof value);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, &value, sizeof value);
    return S_OK;
}

long BinaryWriter::WriteUint32(unsigned int value) {
    char* at = Extend(sizeof value);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, &value, sizeof value);
    return S_OK;
}

long BinaryWriter::WriteUint64(unsigned long long value) {
    char* at = Extend(sizeof value);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, &value, sizeof value);
    return S_OK;
}

long BinaryWriter::WriteString(const ZelUnicodeString& value) {
    const std::string& text = value.str();
    if (text.size() > kMaxSize) return E_FAIL;
    const auto length = static_cast<unsigned int>(text.size());
    char* at = Extend(4ull + length);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, &length, 4);
    if (length > 0) std::memcpy(at + 4, text.data(), length);
    return S_OK;
}

long BinaryWriter::WriteBuffer(const void* data, unsigned int size) {
    if (size == 0) return S_OK;
    if (data == nullptr) return E_FAIL;
    char* at = Extend(size);
    if (at == nullptr) return E_FAIL;
    std::memcpy(at, data, size);
    return S_OK;
}

long BinaryWriter::WriteBuffer(const Binary& data) {
    return WriteBuffer(data.GetData(), data.GetSize());
}

Binary BinaryWriter::CreateBinary() {
    char* data = data_;
    const unsigned int size = size_;
    data_ = nullptr;
    size_ = 0;
    capacity_ = 0;
    if (size == 0) {
        delete[] data;
        return Binary();
    }
    return Binary(data, size, deallocateArrayChar);
}

}  // namespace Nimbo
