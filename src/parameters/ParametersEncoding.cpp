// The binary form of a Parameters.
//
// On top of the kernel's plain values and typed entries (docs/wire-format.md):
//
//   parameters  := magic:uint32 = 0x54410001  objectType:string  body
//   body        := typed entry*               runs to the end of the parameters
//
// Properties are written kind by kind in kind order, by name within a kind; "buffer", "object" and
// "objectArray" properties are typed buffer entries whose bytes start with a 32-bit tag:
//
//   buffer      := int32 = 1  byte*                          the stored bytes, to the entry's end
//   object      := parameters                                the tag is the nested magic
//   objectArray := int32 = 3  count:uint64  elements
//   elements    := elementType:string                        when count is 0
//                | (size:uint64 parameters)[count]           each element's encoding, size bytes
//
// Decoding trusts nothing: every read is bounds-checked by the kernel's readers, nesting is
// limited, and an object-array count is never used to allocate.
#include <cstring>

#include "Nimbo/BinaryReader.h"
#include "Nimbo/BinaryWriter.h"
#include "Nimbo/TypedBinaryReader.h"
#include "Nimbo/TypedBinaryVisitor.h"
#include "Nimbo/TypedBinaryWriter.h"
#include "Tarn/Binary.h"
#include "Tarn/Types.h"
#include "Tarn/TypesImpl.h"
#include "parameters/ParametersImpl.h"

namespace Tarn {
namespace {

constexpr unsigned int kMagic = 0x54410001u;
constexpr int kBufferTag = 1;
constexpr int kObjectArrayTag = 3;
// Deepest nesting of bags that decoding accepts; deeper input fails to decode.
constexpr int kMaxDepth = 64;

// Writes the whole encoding of `impl` into `writer`: the frame, then the entries.
void EncodeInto(Nimbo::TypedBinaryWriter& writer, const ParametersImpl& impl);

// One kind's properties, written with one writer call each; the first failing call ends the kind.
template <typename Table, typename Write>
void WriteEach(const Table& table, Write write) {
    for (const auto& entry : table) {
        if (write(entry.first, entry.second) < 0) break;
    }
}

void EncodeInto(Nimbo::TypedBinaryWriter& writer, const ParametersImpl& impl) {
    Nimbo::BinaryWriter& raw = writer.Raw();
    raw.WriteUint32(kMagic);
    raw.WriteString(impl.objectType);

    using Name = const ZelUnicodeString&;
    WriteEach(impl.strings, [&](Name n, const ZelUnicodeString& v) { return writer.WriteString(n, v); });
    WriteEach(impl.bools, [&](Name n, bool v) { return writer.WriteBool(n, v); });
    WriteEach(impl.int8s, [&](Name n, signed char v) { return writer.WriteInt8(n, v); });
    WriteEach(impl.uint8s, [&](Name n, unsigned char v) { return writer.WriteUint8(n, v); });
    WriteEach(impl.int16s, [&](Name n, short v) { return writer.WriteInt16(n, v); });
    WriteEach(impl.uint16s, [&](Name n, unsigned short v) { return writer.WriteUint16(n, v); });
    WriteEach(impl.int32s, [&](Name n, int v) { return writer.WriteInt32(n, v); });
    WriteEach(impl.uint32s, [&](Name n, unsigned int v) { return writer.WriteUint32(n, v); });
    WriteEach(impl.int64s, [&](Name n, long long v) { return writer.WriteInt64(n, v); });
    WriteEach(impl.uint64s, [&](Name n, unsigned long long v) { return writer.WriteUint64(n, v); });
    WriteEach(impl.floats, [&](Name n, float v) { return writer.WriteFloat(n, v); });
    WriteEach(impl.doubles, [&](Name n, double v) { return writer.WriteDouble(n, v); });

    for (const auto& entry : impl.buffers) {
        unsigned int mark = writer.BeginBuffer(entry.first);
        raw.WriteInt32(kBufferTag);
        raw.WriteBuffer(entry.second);
        writer.EndBuffer(mark);
    }
    for (const auto& entry : impl.objects) {
        unsigned int mark = writer.BeginBuffer(entry.first);
        EncodeInto(writer, ParametersInternal::Impl(*entry.second));
        writer.EndBuffer(mark);
    }

    WriteEach(impl.stringArrays, [&](Name n, const std::vector<ZelUnicodeString>& v) {
        return writer.WriteStrings(n, v);
    });
    std::vector<unsigned char> bytes;
    for (const auto& entry : impl.boolArrays) {
        bytes.assign(entry.second.begin(), entry.second.end());
        writer.WriteArrayBool(entry.first, bytes.empty() ? nullptr : bytes.data(),
                              static_cast<unsigned int>(bytes.size()));
    }
    auto writeArray = [&writer](auto method) {
        return [&writer, method](Name n, const auto& v) {
            return (writer.*method)(n, v.empty() ? nullptr : v.data(),
                                    static_cast<unsigned int>(v.size()));
        };
    };
    using W = Nimbo::TypedBinaryWriter;
    WriteEach(impl.int8Arrays, writeArray(&W::WriteArrayInt8));
    WriteEach(impl.uint8Arrays, writeArray(&W::WriteArrayUint8));
    WriteEach(impl.int16Arrays, writeArray(&W::WriteArrayInt16));
    WriteEach(impl.uint16Arrays, writeArray(&W::WriteArrayUint16));
    WriteEach(impl.int32Arrays, writeArray(&W::WriteArrayInt32));
    WriteEach(impl.uint32Arrays, writeArray(&W::WriteArrayUint32));
    WriteEach(impl.int64Arrays, writeArray(&W::WriteArrayInt64));
    WriteEach(impl.uint64Arrays, writeArray(&W::WriteArrayUint64));
    WriteEach(impl.floatArrays, writeArray(&W::WriteArrayFloat));
    WriteEach(impl.doubleArrays, writeArray(&W::WriteArrayDouble));

    for (const auto& entry : impl.objectArrays) {
        const std::vector<Parameters*>& elements = entry.second.elements;
        unsigned int mark = writer.BeginBuffer(entry.first);
        raw.WriteInt32(kObjectArrayTag);
        raw.WriteUint64(elements.size());
        if (elements.empty()) {
            auto recorded = impl.elementTypes.find(entry.first);
            raw.WriteString(recorded != impl.elementTypes.end() ? recorded->second
                                                                : ZelUnicodeString());
        }
        for (const Parameters* element : elements) {
            if (element == nullptr) {
                raw.WriteUint64(0);
                continue;
            }
            Nimbo::TypedBinaryWriter elementWriter;
            EncodeInto(elementWriter, ParametersInternal::Impl(*element));
            Nimbo::Binary encoded = elementWriter.CreateBinary();
            raw.WriteUint64(encoded.GetSize());
            raw.WriteBuffer(encoded);
        }
        writer.EndBuffer(mark);
    }
}

long DecodeInto(ParametersImpl& impl, const Nimbo::Binary& bytes, int depth);

// Fills one bag from the typed entries of its body.
class BinaryDecodingVisitor : public Nimbo::TypedBinaryVisitor {
public:
    BinaryDecodingVisitor(ParametersImpl& impl, int depth) : impl_(impl), depth_(depth) {}

    bool OnArrayDouble(const ZelUnicodeString& n, unsigned int c, double*& a) override {
        return Store(impl_.doubleArrays, n, c, a);
    }
    bool OnArrayFloat(const ZelUnicodeString& n, unsigned int c, float*& a) override {
        return Store(impl_.floatArrays, n, c, a);
    }
    bool OnArrayUint64(const ZelUnicodeString& n, unsigned int c, unsigned long long*& a) override {
        return Store(impl_.uint64Arrays, n, c, a);
    }
    bool OnArrayInt64(const ZelUnicodeString& n, unsigned int c, long long*& a) override {
        return Store(impl_.int64Arrays, n, c, a);
    }
    bool OnArrayUint32(const ZelUnicodeString& n, unsigned int c, unsigned int*& a) override {
        return Store(impl_.uint32Arrays, n, c, a);
    }
    bool OnArrayInt32(const ZelUnicodeString& n, unsigned int c, int*& a) override {
        return Store(impl_.int32Arrays, n, c, a);
    }
    bool OnArrayUint16(const ZelUnicodeString& n, unsigned int c, unsigned short*& a) override {
        return Store(impl_.uint16Arrays, n, c, a);
    }
    bool OnArrayInt16(const ZelUnicodeString& n, unsigned int c, short*& a) override {
        return Store(impl_.int16Arrays, n, c, a);
    }
    bool OnArrayUint8(const ZelUnicodeString& n, unsigned int c, unsigned char*& a) override {
        return Store(impl_.uint8Arrays, n, c, a);
    }
    bool OnArrayInt8(const ZelUnicodeString& n, unsigned int c, signed char*& a) override {
        return Store(impl_.int8Arrays, n, c, a);
    }
    bool OnArrayBool(const ZelUnicodeString& n, unsigned int c, unsigned char*& a) override {
        std::vector<bool>& bits = impl_.boolArrays[n];
        bits.assign(c, false);
        for (unsigned int i = 0; i < c; ++i) bits[i] = a[i] != 0;
        delete[] a;
        a = nullptr;
        return true;
    }
    bool OnBuffer(const ZelUnicodeString& n, const Nimbo::Binary& entry) override;
    bool OnDouble(const ZelUnicodeString& n, double v) override { return Set(impl_.doubles, n, v); }
    bool OnFloat(const ZelUnicodeString& n, float v) override { return Set(impl_.floats, n, v); }
    bool OnUint64(const ZelUnicodeString& n, unsigned long long v) override {
        return Set(impl_.uint64s, n, v);
    }
    bool OnInt64(const ZelUnicodeString& n, long long v) override { return Set(impl_.int64s, n, v); }
    bool OnUint32(const ZelUnicodeString& n, unsigned int v) override {
        return Set(impl_.uint32s, n, v);
    }
    bool OnInt32(const ZelUnicodeString& n, int v) override { return Set(impl_.int32s, n, v); }
    bool OnUint16(const ZelUnicodeString& n, unsigned short v) override {
        return Set(impl_.uint16s, n, v);
    }
    bool OnInt16(const ZelUnicodeString& n, short v) override { return Set(impl_.int16s, n, v); }
    bool OnUint8(const ZelUnicodeString& n, unsigned char v) override {
        return Set(impl_.uint8s, n, v);
    }
    bool OnInt8(const ZelUnicodeString& n, signed char v) override { return Set(impl_.int8s, n, v); }
    bool OnBool(const ZelUnicodeString& n, bool v) override { return Set(impl_.bools, n, v); }
    bool OnStrings(const ZelUnicodeString& n, const std::vector<ZelUnicodeString>& v) override {
        return Set(impl_.stringArrays, n, v);
    }
    bool OnString(const ZelUnicodeString& n, const ZelUnicodeString& v) override {
        return Set(impl_.strings, n, v);
    }

private:
    template <typename T, typename V>
    static bool Set(Table<T>& table, const ZelUnicodeString& name, const V& value) {
        table.insert_or_assign(name, value);
        return true;
    }
    template <typename T>
    static bool Store(Table<std::vector<T>>& table, const ZelUnicodeString& name,
                      unsigned int count, T*& array) {
        std::vector<T>& stored = table[name];
        stored.assign(array, array + (array != nullptr ? count : 0));
        delete[] array;
        array = nullptr;
        return true;
    }

    bool DecodeObject(const ZelUnicodeString& name, const Nimbo::Binary& entry);
    bool DecodeObjectArray(const ZelUnicodeString& name, Nimbo::BinaryReader& reader);

    ParametersImpl& impl_;
    int depth_;
};

bool BinaryDecodingVisitor::OnBuffer(const ZelUnicodeString& name, const Nimbo::Binary& entry) {
    Nimbo::BinaryReader reader(entry);
    int tag = 0;
    if (reader.ReadInt32(tag) < 0) return false;
    if (tag == kBufferTag) {
        unsigned int size = entry.GetSize() - reader.Tell();
        // A private copy: keeping a slice would hold the whole message alive.
        char* copy = size != 0 ? new char[size] : nullptr;
        if (size != 0 && reader.ReadBuffer(copy, size) < 0) {
            delete[] copy;
            return false;
        }
        impl_.buffers.insert_or_assign(
            name, Nimbo::Binary(copy, size, copy != nullptr ? Nimbo::deallocateArrayChar : nullptr));
        return true;
    }
    if (static_cast<unsigned int>(tag) == kMagic) return DecodeObject(name, entry);
    if (tag == kObjectArrayTag) return DecodeObjectArray(name, reader);
    return false;
}

bool BinaryDecodingVisitor::DecodeObject(const ZelUnicodeString& name,
                                         const Nimbo::Binary& entry) {
    if (depth_ >= kMaxDepth) return false;
    std::unique_ptr<Parameters>& slot = impl_.objects[name];
    if (!slot) slot.reset(impl_.NewParameters("Parameters"));
    return DecodeInto(ParametersInternal::Impl(*slot), entry, depth_ + 1) >= 0;
}

bool BinaryDecodingVisitor::DecodeObjectArray(const ZelUnicodeString& name,
                                              Nimbo::BinaryReader& reader) {
    if (depth_ >= kMaxDepth) return false;
    std::vector<Parameters*>& elements = impl_.objectArrays[name].elements;
    unsigned long long count = 0;
    if (reader.ReadUint64(count) < 0) return false;
    if (count == 0) {
        ZelUnicodeString elementType;
        if (reader.ReadString(elementType) < 0) return false;
        // No recorded type is written as "", and stays no record.
        if (elementType.IsEmpty()) {
            impl_.elementTypes.erase(name);
        } else {
            impl_.elementTypes.insert_or_assign(name, elementType);
        }
        return true;
    }
    // The count is the sender's claim: elements are read while bytes last, never allocated ahead.
    for (unsigned long long i = 0; i < count; ++i) {
        unsigned long long size = 0;
        Nimbo::Binary bytes;
        if (reader.ReadUint64(size) < 0 || size > reader.Remaining() ||
            reader.ReadBinary(static_cast<unsigned int>(size), bytes) < 0) {
            // An unreadable element ends the array; the elements before it stay.
            return true;
        }
        std::unique_ptr<Parameters> element(impl_.NewParameters("Parameters"));
        if (DecodeInto(ParametersInternal::Impl(*element), bytes, depth_ + 1) < 0) return false;
        elements.push_back(element.release());
    }
    return true;
}

long DecodeInto(ParametersImpl& impl, const Nimbo::Binary& bytes, int depth) {
    impl.Clear();
    Nimbo::BinaryReader reader(bytes);
    int magic = 0;
    if (reader.ReadInt32(magic) < 0 || static_cast<unsigned int>(magic) != kMagic) return E_FAIL;
    if (reader.ReadString(impl.objectType) < 0) return E_FAIL;
    Nimbo::Binary body;
    if (reader.ReadBinary(reader.Remaining(), body) < 0) return E_FAIL;
    BinaryDecodingVisitor visitor(impl, depth);
    return Nimbo::TypedBinaryReader(body).Apply(visitor);
}

}  // namespace

Nimbo::Binary Parameters::ToBinary() const {
    Nimbo::TypedBinaryWriter writer;
    EncodeInto(writer, *impl_);
    return writer.CreateBinary();
}

long Parameters::FromBinary(const Nimbo::Binary& bytes) { return DecodeInto(*impl_, bytes, 0); }

Parameters::Parameters(const Types& types, const Nimbo::Binary& bytes)
    : impl_(new ParametersImpl(types.GetImpl(), "Parameters")) {
    // What failed to decode is left out; the bag keeps what came before it.
    FromBinary(bytes);
}

Parameters::Parameters(const Types& types, const Binary& bytes)
    : Parameters(types, static_cast<Nimbo::Binary>(bytes)) {}

}  // namespace Tarn
