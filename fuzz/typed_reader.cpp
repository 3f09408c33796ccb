// Fuzzes TypedBinaryReader::Apply over arbitrary bytes, with a visitor that writes every entry it
// receives back out through a TypedBinaryWriter.
//
// Besides surviving any input, the walk must be exact: the entries handed over, written again,
// are byte for byte the start of the input, and all of it when Apply succeeds. A difference means
// that reader and writer disagree about the layout.
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/ResultCodes.h"
#include "Nimbo/TypedBinaryReader.h"
#include "Nimbo/TypedBinaryVisitor.h"
#include "Nimbo/TypedBinaryWriter.h"

namespace {

class Rewriter : public Nimbo::TypedBinaryVisitor {
public:
    Nimbo::TypedBinaryWriter out;

    bool OnArrayDouble(const ZelUnicodeString& n, unsigned int c, double*& a) override {
        return Own(a, out.WriteArrayDouble(n, a, c));
    }
    bool OnArrayFloat(const ZelUnicodeString& n, unsigned int c, float*& a) override {
        return Own(a, out.WriteArrayFloat(n, a, c));
    }
    bool OnArrayUint64(const ZelUnicodeString& n, unsigned int c, unsigned long long*& a) override {
        return Own(a, out.WriteArrayUint64(n, a, c));
    }
    bool OnArrayInt64(const ZelUnicodeString& n, unsigned int c, long long*& a) override {
        return Own(a, out.WriteArrayInt64(n, a, c));
    }
    bool OnArrayUint32(const ZelUnicodeString& n, unsigned int c, unsigned int*& a) override {
        return Own(a, out.WriteArrayUint32(n, a, c));
    }
    bool OnArrayInt32(const ZelUnicodeString& n, unsigned int c, int*& a) override {
        return Own(a, out.WriteArrayInt32(n, a, c));
    }
    bool OnArrayUint16(const ZelUnicodeString& n, unsigned int c, unsigned short*& a) override {
        return Own(a, out.WriteArrayUint16(n, a, c));
    }
    bool OnArrayInt16(const ZelUnicodeString& n, unsigned int c, short*& a) override {
        return Own(a, out.WriteArrayInt16(n, a, c));
    }
    bool OnArrayUint8(const ZelUnicodeString& n, unsigned int c, unsigned char*& a) override {
        return Own(a, out.WriteArrayUint8(n, a, c));
    }
    bool OnArrayInt8(const ZelUnicodeString& n, unsigned int c, signed char*& a) override {
        return Own(a, out.WriteArrayInt8(n, a, c));
    }
    bool OnArrayBool(const ZelUnicodeString& n, unsigned int c, unsigned char*& a) override {
        return Own(a, out.WriteArrayBool(n, a, c));
    }
    bool OnBuffer(const ZelUnicodeString& n, const Nimbo::Binary& v) override {
        return out.WriteBuffer(n, v) >= 0;
    }
    bool OnDouble(const ZelUnicodeString& n, double v) override {
        return out.WriteDouble(n, v) >= 0;
    }
    bool OnFloat(const ZelUnicodeString& n, float v) override { return out.WriteFloat(n, v) >= 0; }
    bool OnUint64(const ZelUnicodeString& n, unsigned long long v) override {
        return out.WriteUint64(n, v) >= 0;
    }
    bool OnInt64(const ZelUnicodeString& n, long long v) override {
        return out.WriteInt64(n, v) >= 0;
    }
    bool OnUint32(const ZelUnicodeString& n, unsigned int v) override {
        return out.WriteUint32(n, v) >= 0;
    }
    bool OnInt32(const ZelUnicodeString& n, int v) override { return out.WriteInt32(n, v) >= 0; }
    bool OnUint16(const ZelUnicodeString& n, unsigned short v) override {
        return out.WriteUint16(n, v) >= 0;
    }
    bool OnInt16(const ZelUnicodeString& n, short v) override { return out.WriteInt16(n, v) >= 0; }
    bool OnUint8(const ZelUnicodeString& n, unsigned char v) override {
        return out.WriteUint8(n, v) >= 0;
    }
    bool OnInt8(const ZelUnicodeString& n, signed char v) override {
        return out.WriteInt8(n, v) >= 0;
    }
    bool OnBool(const ZelUnicodeString& n, bool v) override { return out.WriteBool(n, v) >= 0; }
    bool OnStrings(const ZelUnicodeString& n, const std::vector<ZelUnicodeString>& v) override {
        return out.WriteStrings(n, v) >= 0;
    }
    bool OnString(const ZelUnicodeString& n, const ZelUnicodeString& v) override {
        return out.WriteString(n, v) >= 0;
    }

private:
    template <typename T>
    static bool Own(T*& array, long result) {
        delete[] array;
        array = nullptr;
        return result >= 0;
    }
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    if (size > 0xFFFFFFFFu) return 0;
    // A copy of exactly the input, so that a read past it is caught.
    char* copy = new char[size];
    if (size > 0) std::memcpy(copy, data, size);
    const Nimbo::Binary input(copy, static_cast<unsigned int>(size), Nimbo::deallocateArrayChar);

    Rewriter rewriter;
    const long result = Nimbo::TypedBinaryReader(input).Apply(rewriter);
    const Nimbo::Binary again = rewriter.out.CreateBinary();

    if (again.GetSize() > size || (result >= 0 && again.GetSize() != size)) __builtin_trap();
    if (again.GetSize() > 0 && std::memcmp(again.GetData(), data, again.GetSize()) != 0) {
        __builtin_trap();
    }
    return 0;
}
