// Nimbo::BinaryWriter: appends unnamed values to a growing block of bytes.
//
// Numbers go out little-endian at their fixed width, a string as its byte length (uint32) then its
// bytes, and WriteBuffer appends raw bytes with no length, so whoever reads them must know where
// they end (docs/wire-format.md has the whole layout). The writer owns its block until
// CreateBinary hands it over without a copy; the writer is then empty and may be used again.
//
// A block holds at most 2^32 - 1 bytes. A write that would pass that, or that cannot get memory,
// returns E_FAIL, writes nothing and leaves the writer as it was. Growth is amortised (the block
// doubles), so appending costs no allocation most of the time; give the expected size to the
// constructor or to Reserve to avoid even those.
//
// One writer must not be used from two threads at once.
#ifndef NIMBO_BINARYWRITER_H_
#define NIMBO_BINARYWRITER_H_

#include "Nimbo/Binary.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class TypedBinaryWriter;

class BinaryWriter {
public:
    // Allocates `initialCapacity` bytes up front (none for 0).
    explicit BinaryWriter(unsigned int initialCapacity = 0);
    ~BinaryWriter();
    BinaryWriter(const BinaryWriter&) = delete;
    BinaryWriter& operator=(const BinaryWriter&) = delete;

    long WriteInt32(int value);
    long WriteUint32(unsigned int value);
    long WriteUint64(unsigned long long value);
    // Byte length (uint32), then the UTF-8 bytes without a terminator.
    long WriteString(const ZelUnicodeString& value);
    // The `size` bytes at `data`, without a length. `data` may be null when `size` is 0.
    long WriteBuffer(const void* data, unsigned int size);
    long WriteBuffer(const Binary& data);

    // Makes room for `additional` more bytes, so that writes up to that much do not allocate.
    long Reserve(unsigned int additional);

    // Bytes written so far.
    unsigned int Tell() const { return size_; }

    // Hands the bytes written over to a Binary (released with deallocateArrayChar) without copying
    // them, and leaves the writer empty.
    Binary CreateBinary();

private:
    friend class TypedBinaryWriter;

    // Appends `size` (> 0) bytes left for the caller to fill and returns where they start, or null
    // when the block cannot take them (then nothing changed).
    char* Extend(unsigned long long size);
    bool Grow(unsigned long long needed);

    char* data_ = nullptr;
    unsigned int size_ = 0;
    unsigned int capacity_ = 0;
};

}  // namespace Nimbo

#endif  // NIMBO_BINARYWRITER_H_
