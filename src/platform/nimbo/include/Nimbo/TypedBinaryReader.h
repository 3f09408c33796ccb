// Nimbo::TypedBinaryReader: walks the entries of a block written by TypedBinaryWriter and hands
// each one to a TypedBinaryVisitor.
//
// The block comes from another node and is not trusted. Apply checks every length and count
// against the bytes left before it allocates anything, so no entry makes it allocate more than a
// small multiple of the block's size, and it always ends: every entry consumes bytes.
//
// The reader keeps a copy of its Binary (sharing the bytes). Apply does not change the reader:
// it may be called again, and from several threads at once with a visitor each.
#ifndef NIMBO_TYPEDBINARYREADER_H_
#define NIMBO_TYPEDBINARYREADER_H_

#include "Nimbo/Binary.h"
#include "Nimbo/TypedBinaryVisitor.h"

namespace Nimbo {

class TypedBinaryReader {
public:
    explicit TypedBinaryReader(const Binary& body);

    // Calls one handler of `visitor` per entry, in the order written. Stops at the first entry
    // that cannot be read whole (truncated, a length or count past the end, an unknown tag, a bool
    // byte other than 0 or 1) or whose handler returns false, and returns E_FAIL; the entries
    // before it have been handed over. S_OK once every entry is handled (none for empty bytes).
    long Apply(TypedBinaryVisitor& visitor) const;

private:
    Binary body_;
};

}  // namespace Nimbo

#endif  // NIMBO_TYPEDBINARYREADER_H_
