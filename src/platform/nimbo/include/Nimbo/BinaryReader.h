// Nimbo::BinaryReader: reads back, in order, the unnamed values a BinaryWriter wrote.
//
// The reader keeps a copy of its Binary (which shares the bytes, see Binary.h), so the bytes stay
// alive as long as the reader and whatever ReadBinary handed out. Every read checks the bytes left
// first: a read that does not fit returns E_FAIL and changes neither its output nor the position.
// Sizes come from the bytes themselves and are never trusted: a length that claims more than is
// left simply fails.
//
// One reader must not be used from two threads at once; several readers may share one Binary.
#ifndef NIMBO_BINARYREADER_H_
#define NIMBO_BINARYREADER_H_

#include "Nimbo/Binary.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class BinaryReader {
public:
    explicit BinaryReader(const Binary& source);

    long ReadInt32(int& value);
    long ReadUint32(unsigned int& value);
    long ReadUint64(unsigned long long& value);
    // A length-prefixed string, as BinaryWriter::WriteString wrote it.
    long ReadString(ZelUnicodeString& value);
    // Exactly `size` raw bytes, as a slice sharing the source (no copy). 0 gives an empty Binary.
    long ReadBinary(unsigned int size, Binary& value);
    // Exactly `size` raw bytes, copied to `out` (which may be null when `size` is 0).
    long ReadBuffer(void* out, unsigned int size);

    // Bytes read so far, and bytes left.
    unsigned int Tell() const { return position_; }
    unsigned int Remaining() const { return size_ - position_; }

private:
    Binary source_;
    const char* data_;
    unsigned int size_;
    unsigned int position_ = 0;
};

}  // namespace Nimbo

#endif  // NIMBO_BINARYREADER_H_
