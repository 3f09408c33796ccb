// Reads the plain values of BinaryWriter.cpp; the layout is written down there.
#include "Nimbo/BinaryReader.h"

#include <cstring>

#include "Nimbo/ResultCodes.h"

namespace Nimbo {

static_assert(__BYTE_ORDER__ == __ORDER_LITTLE_ENDIAN__,
              "the readers copy numbers to memory and need a little-endian host");

BinaryReader::BinaryReader(const Binary& source)
    : source_(source), data_(static_cast<const char*>(source.GetData())), size_(source.GetSize()) {}

long BinaryReader::ReadBuffer(void* out, unsigned int size) {
    if (size > Remaining()) return E_FAIL;
    if (size == 0) return S_OK;
    if (out == nullptr) return E_FAIL;
    std::memcpy(out, data_ + position_, size);
    position_ += size;
    return S_OK;
}

long BinaryReader::ReadInt32(int& value) { return ReadBuffer(&value, sizeof value); }

long BinaryReader::ReadUint32(unsigned int& value) { return ReadBuffer(&value, sizeof value); }

long BinaryReader::ReadUint64(unsigned long long& value) {
    return ReadBuffer(&value, sizeof value);
}

long BinaryReader::ReadString(ZelUnicodeString& value) {
    unsigned int length = 0;
    if (Remaining() < sizeof length) return E_FAIL;
    std::memcpy(&length, data_ + position_, sizeof length);
    if (length > Remaining() - sizeof length) return E_FAIL;
    value = ZelUnicodeString(data_ + position_ + sizeof length, length);
    position_ += sizeof length + length;
    return S_OK;
}

long BinaryReader::ReadBinary(unsigned int size, Binary& value) {
    if (size > Remaining()) return E_FAIL;
    value = source_.Slice(position_, size);
    position_ += size;
    return S_OK;
}

}  // namespace Nimbo
