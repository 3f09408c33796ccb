// Nimbo::TypedBinaryWriter: appends named, typed entries (a kind tag, the name, the value) to a
// block of bytes, for TypedBinaryReader to hand back to a TypedBinaryVisitor.
//
// The block is a plain sequence of entries with no header or count, so the bytes of no entries are
// empty and two blocks concatenated are one block. Arrays and strings carry their count, buffer
// entries their byte length; docs/wire-format.md has the layout.
//
// Ownership, failures and threads are as for BinaryWriter, which the writer appends through: a
// failed write (too large for 2^32 - 1 bytes, or out of memory) writes nothing.
//
// To encode a nested value in place, without building it apart and copying it in:
//
//     unsigned int mark = writer.BeginBuffer("child");
//     child.EncodeInto(writer);                // plain appends through writer.Raw(), typed entries
//     writer.EndBuffer(mark);                  // same bytes as WriteBuffer("child", encoding)
//
// Everything written between BeginBuffer and EndBuffer, raw or typed, becomes the entry's bytes, so
// a nested block is written with the same writer. Marks nest: end the inner entry first. Never
// call Raw().CreateBinary(), which would take the bytes from under this writer.
#ifndef NIMBO_TYPEDBINARYWRITER_H_
#define NIMBO_TYPEDBINARYWRITER_H_

#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/BinaryWriter.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

enum class TypedEntryTag : unsigned char;

class TypedBinaryWriter {
public:
    // What BeginBuffer returns when it could not start the entry; EndBuffer refuses it.
    static constexpr unsigned int kInvalidMark = 0xFFFFFFFFu;

    explicit TypedBinaryWriter(unsigned int initialCapacity = 0);
    TypedBinaryWriter(const TypedBinaryWriter&) = delete;
    TypedBinaryWriter& operator=(const TypedBinaryWriter&) = delete;

    long WriteString(const ZelUnicodeString& name, const ZelUnicodeString& value);
    long WriteBool(const ZelUnicodeString& name, bool value);
    long WriteInt8(const ZelUnicodeString& name, signed char value);
    long WriteUint8(const ZelUnicodeString& name, unsigned char value);
    long WriteInt16(const ZelUnicodeString& name, short value);
    long WriteUint16(const ZelUnicodeString& name, unsigned short value);
    long WriteInt32(const ZelUnicodeString& name, int value);
    long WriteUint32(const ZelUnicodeString& name, unsigned int value);
    long WriteInt64(const ZelUnicodeString& name, long long value);
    long WriteUint64(const ZelUnicodeString& name, unsigned long long value);
    long WriteFloat(const ZelUnicodeString& name, float value);
    long WriteDouble(const ZelUnicodeString& name, double value);

    // A byte entry: its length, then the bytes. `data` may be null when `size` is 0.
    long WriteBuffer(const ZelUnicodeString& name, const void* data, unsigned int size);
    long WriteBuffer(const ZelUnicodeString& name, const Binary& data);

    long WriteStrings(const ZelUnicodeString& name, const std::vector<ZelUnicodeString>& values);

    // Arrays of `count` elements from `values`, which may be null when `count` is 0 (and is then
    // not read). Bool arrays take one byte per element and keep each byte as it is.
    long WriteArrayBool(const ZelUnicodeString& name, const unsigned char* values,
                        unsigned int count);
    long WriteArrayInt8(const ZelUnicodeString& name, const signed char* values,
                        unsigned int count);
    long WriteArrayUint8(const ZelUnicodeString& name, const unsigned char* values,
                         unsigned int count);
    long WriteArrayInt16(const ZelUnicodeString& name, const short* values, unsigned int count);
    long WriteArrayUint16(const ZelUnicodeString& name, const unsigned short* values,
                          unsigned int count);
    long WriteArrayInt32(const ZelUnicodeString& name, const int* values, unsigned int count);
    long WriteArrayUint32(const ZelUnicodeString& name, const unsigned int* values,
                          unsigned int count);
    long WriteArrayInt64(const ZelUnicodeString& name, const long long* values, unsigned int count);
    long WriteArrayUint64(const ZelUnicodeString& name, const unsigned long long* values,
                          unsigned int count);
    long WriteArrayFloat(const ZelUnicodeString& name, const float* values, unsigned int count);
    long WriteArrayDouble(const ZelUnicodeString& name, const double* values, unsigned int count);

    // Starts a byte entry whose bytes the caller then appends through Raw(); returns the mark to
    // give to EndBuffer, or kInvalidMark when the entry could not be started.
    unsigned int BeginBuffer(const ZelUnicodeString& name);
    // The plain writer underneath, for the bytes of an open buffer entry.
    BinaryWriter& Raw() { return raw_; }
    // Closes the byte entry started at `mark`. Fails for kInvalidMark, a mark past the end or one
    // whose entry is already closed; the bytes written are then not a valid block.
    long EndBuffer(unsigned int mark);

    unsigned int Tell() const { return raw_.Tell(); }
    // Hands the entries over without copying (see BinaryWriter::CreateBinary).
    Binary CreateBinary() { return raw_.CreateBinary(); }

private:
    char* BeginEntry(TypedEntryTag tag, const ZelUnicodeString& name,
                     unsigned long long payloadSize);
    template <typename T>
    long WriteScalar(TypedEntryTag tag, const ZelUnicodeString& name, T value);
    template <typename T>
    long WriteArray(TypedEntryTag tag, const ZelUnicodeString& name, const T* values,
                    unsigned int count);

    BinaryWriter raw_;
};

}  // namespace Nimbo

#endif  // NIMBO_TYPEDBINARYWRITER_H_
