// Reads the blocks of TypedBinaryWriter.cpp; the layout is written down there.
//
// Nothing in a block is trusted. A count is checked against the bytes left before the array is
// allocated (count * element size <= bytes left, so an array is never larger than the block), and
// a string list is checked the same way at 4 bytes per string, the least one can take. Every entry
// consumes at least its tag and name length, so the walk always ends.
#include "Nimbo/TypedBinaryReader.h"

#include <new>
#include <utility>

#include "Nimbo/BinaryReader.h"
#include "Nimbo/ResultCodes.h"
#include "TypedEntryTag.h"

namespace Nimbo {

namespace {

template <typename T>
using ScalarHandler = bool (TypedBinaryVisitor::*)(const ZelUnicodeString&, T);
template <typename T>
using ArrayHandler = bool (TypedBinaryVisitor::*)(const ZelUnicodeString&, unsigned int, T*&);

// Each Visit reads one payload and hands it over: true when it was read and stored.

template <typename T>
bool VisitScalar(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor,
                 ScalarHandler<T> handler) {
    T value;
    if (in.ReadBuffer(&value, sizeof value) < 0) return false;
    return (visitor.*handler)(name, value);
}

bool VisitBool(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor) {
    unsigned char value = 0;
    if (in.ReadBuffer(&value, 1) < 0 || value > 1) return false;
    return visitor.OnBool(name, value != 0);
}

template <typename T>
bool VisitArray(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor,
                ArrayHandler<T> handler) {
    unsigned int count = 0;
    if (in.ReadUint32(count) < 0 || count > in.Remaining() / sizeof(T)) return false;
    T* array = nullptr;
    if (count > 0) {
        array = new (std::nothrow) T[count];
        if (array == nullptr) return false;
        // Fits: count * sizeof(T) <= Remaining().
        in.ReadBuffer(array, count * static_cast<unsigned int>(sizeof(T)));
    }
    // The handler owns the array from here on, whatever it returns.
    return (visitor.*handler)(name, count, array);
}

bool VisitString(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor) {
    ZelUnicodeString value;
    if (in.ReadString(value) < 0) return false;
    return visitor.OnString(name, value);
}

bool VisitStrings(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor) {
    unsigned int count = 0;
    if (in.ReadUint32(count) < 0 || count > in.Remaining() / 4) return false;
    std::vector<ZelUnicodeString> values;
    values.reserve(count);
    for (unsigned int i = 0; i < count; ++i) {
        ZelUnicodeString value;
        if (in.ReadString(value) < 0) return false;
        values.push_back(std::move(value));
    }
    return visitor.OnStrings(name, values);
}

bool VisitBuffer(BinaryReader& in, const ZelUnicodeString& name, TypedBinaryVisitor& visitor) {
    unsigned int size = 0;
    Binary value;
    if (in.ReadUint32(size) < 0 || in.ReadBinary(size, value) < 0) return false;
    return visitor.OnBuffer(name, value);
}

bool VisitEntry(BinaryReader& in, TypedEntryTag tag, const ZelUnicodeString& name,
                TypedBinaryVisitor& v) {
    using V = TypedBinaryVisitor;
    switch (tag) {
        case TypedEntryTag::kString:
            return VisitString(in, name, v);
        case TypedEntryTag::kBool:
            return VisitBool(in, name, v);
        case TypedEntryTag::kInt8:
            return VisitScalar(in, name, v, &V::OnInt8);
        case TypedEntryTag::kUint8:
            return VisitScalar(in, name, v, &V::OnUint8);
        case TypedEntryTag::kInt16:
            return VisitScalar(in, name, v, &V::OnInt16);
        case TypedEntryTag::kUint16:
            return VisitScalar(in, name, v, &V::OnUint16);
        case TypedEntryTag::kInt32:
            return VisitScalar(in, name, v, &V::OnInt32);
        case TypedEntryTag::kUint32:
            return VisitScalar(in, name, v, &V::OnUint32);
        case TypedEntryTag::kInt64:
            return VisitScalar(in, name, v, &V::OnInt64);
        case TypedEntryTag::kUint64:
            return VisitScalar(in, name, v, &V::OnUint64);
        case TypedEntryTag::kFloat:
            return VisitScalar(in, name, v, &V::OnFloat);
        case TypedEntryTag::kDouble:
            return VisitScalar(in, name, v, &V::OnDouble);
        case TypedEntryTag::kBuffer:
            return VisitBuffer(in, name, v);
        case TypedEntryTag::kStrings:
            return VisitStrings(in, name, v);
        case TypedEntryTag::kArrayBool:
            return VisitArray(in, name, v, &V::OnArrayBool);
        case TypedEntryTag::kArrayInt8:
            return VisitArray(in, name, v, &V::OnArrayInt8);
        case TypedEntryTag::kArrayUint8:
            return VisitArray(in, name, v, &V::OnArrayUint8);
        case TypedEntryTag::kArrayInt16:
            return VisitArray(in, name, v, &V::OnArrayInt16);
        case TypedEntryTag::kArrayUint16:
            return VisitArray(in, name, v, &V::OnArrayUint16);
        case TypedEntryTag::kArrayInt32:
            return VisitArray(in, name, v, &V::OnArrayInt32);
        case TypedEntryTag::kArrayUint32:
            return VisitArray(in, name, v, &V::OnArrayUint32);
        case TypedEntryTag::kArrayInt64:
            return VisitArray(in, name, v, &V::OnArrayInt64);
        case TypedEntryTag::kArrayUint64:
            return VisitArray(in, name, v, &V::OnArrayUint64);
        case TypedEntryTag::kArrayFloat:
            return VisitArray(in, name, v, &V::OnArrayFloat);
        case TypedEntryTag::kArrayDouble:
            return VisitArray(in, name, v, &V::OnArrayDouble);
    }
    return false;  // not a tag of ours
}

}  // namespace

TypedBinaryReader::TypedBinaryReader(const Binary& body) : body_(body) {}

long TypedBinaryReader::Apply(TypedBinaryVisitor& visitor) const {
    BinaryReader in(body_);
    ZelUnicodeString name;
    while (in.Remaining() > 0) {
        unsigned char tag = 0;
        if (in.ReadBuffer(&tag, 1) < 0 || in.ReadString(name) < 0) return E_FAIL;
        if (!VisitEntry(in, static_cast<TypedEntryTag>(tag), name, visitor)) return E_FAIL;
    }
    return S_OK;
}

}  // namespace Nimbo
