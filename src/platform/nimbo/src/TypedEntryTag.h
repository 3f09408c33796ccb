// The kind tags of typed entries, shared by TypedBinaryWriter and TypedBinaryReader.
//
// The values are part of the byte layout (docs/wire-format.md) and never change; 0 is left unused
// so that zero-filled memory never reads as an entry.
#ifndef NIMBO_TYPEDENTRYTAG_H_
#define NIMBO_TYPEDENTRYTAG_H_

namespace Nimbo {

enum class TypedEntryTag : unsigned char {
    kString = 1,
    kBool = 2,
    kInt8 = 3,
    kUint8 = 4,
    kInt16 = 5,
    kUint16 = 6,
    kInt32 = 7,
    kUint32 = 8,
    kInt64 = 9,
    kUint64 = 10,
    kFloat = 11,
    kDouble = 12,
    kBuffer = 13,
    kStrings = 14,
    kArrayBool = 15,
    kArrayInt8 = 16,
    kArrayUint8 = 17,
    kArrayInt16 = 18,
    kArrayUint16 = 19,
    kArrayInt32 = 20,
    kArrayUint32 = 21,
    kArrayInt64 = 22,
    kArrayUint64 = 23,
    kArrayFloat = 24,
    kArrayDouble = 25,
};

}  // namespace Nimbo

#endif  // NIMBO_TYPEDENTRYTAG_H_
