// Helpers shared by the codec tests: byte blocks, and a visitor that logs every entry it receives
// and may write it back out.
#ifndef TESTS_CODEC_CODECTESTSUPPORT_H_
#define TESTS_CODEC_CODECTESTSUPPORT_H_

#include <cstring>
#include <initializer_list>
#include <sstream>
#include <string>
#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/TypedBinaryVisitor.h"
#include "Nimbo/TypedBinaryWriter.h"

// A copy in a block of exactly `size` bytes, so that AddressSanitizer catches a read past it.
inline Nimbo::Binary Copy(const void* data, unsigned int size) {
    char* copy = new char[size];
    if (size > 0) std::memcpy(copy, data, size);
    return Nimbo::Binary(copy, size, Nimbo::deallocateArrayChar);
}

// A block holding `bytes` (each 0..255).
inline Nimbo::Binary Bytes(std::initializer_list<int> bytes) {
    const std::string text(bytes.begin(), bytes.end());
    return Copy(text.data(), static_cast<unsigned int>(text.size()));
}

// The bytes of a block, which GoogleTest prints escaped when a comparison fails.
inline std::string Str(const Nimbo::Binary& binary) {
    return std::string(static_cast<const char*>(binary.GetData()), binary.GetSize());
}

// Logs each entry as one line, e.g. "int32 n=-5", "int16[] a=[1,2]" or "bool[] b=null", refuses
// (returns false on) the entry numbered `refuseAt`, writes each entry again to `out` when there is
// one, keeps the last buffer entry, and releases every array it is given.
class Recorder : public Nimbo::TypedBinaryVisitor {
public:
    explicit Recorder(int refuseAt = -1, Nimbo::TypedBinaryWriter* out = nullptr)
        : refuseAt(refuseAt), out(out) {}
    std::vector<std::string> lines;
    Nimbo::Binary buffer;

#define CODEC_TEST_ENTRY(Kind, T, label)                     \
    bool On##Kind(const ZelUnicodeString& n, T v) override { \
        if (out) out->Write##Kind(n, v);                     \
        return Log(label, n, Text(v));                       \
    }
#define CODEC_TEST_ARRAY(Kind, T, label)                                            \
    bool OnArray##Kind(const ZelUnicodeString& n, unsigned int c, T*& a) override { \
        if (out) out->WriteArray##Kind(n, a, c);                                    \
        const std::string text = a ? "[" + Join(a, c) + "]" : "null";              \
        delete[] a;                                                                 \
        a = nullptr;                                                                \
        return Log(label "[]", n, text);                                            \
    }
#define CODEC_TEST_NUMBER(Kind, T, label) \
    CODEC_TEST_ENTRY(Kind, T, label) CODEC_TEST_ARRAY(Kind, T, label)
    // clang-format off
    CODEC_TEST_NUMBER(Double, double, "double") CODEC_TEST_NUMBER(Float, float, "float")
    CODEC_TEST_NUMBER(Uint64, unsigned long long, "uint64")
    CODEC_TEST_NUMBER(Int64, long long, "int64") CODEC_TEST_NUMBER(Int32, int, "int32")
    CODEC_TEST_NUMBER(Uint32, unsigned int, "uint32")
    CODEC_TEST_NUMBER(Uint16, unsigned short, "uint16") CODEC_TEST_NUMBER(Int16, short, "int16")
    CODEC_TEST_NUMBER(Uint8, unsigned char, "uint8") CODEC_TEST_NUMBER(Int8, signed char, "int8")
    CODEC_TEST_ARRAY(Bool, unsigned char, "bool") CODEC_TEST_ENTRY(Bool, bool, "bool")
    CODEC_TEST_ENTRY(String, const ZelUnicodeString&, "string")
    CODEC_TEST_ENTRY(Strings, const std::vector<ZelUnicodeString>&, "string[]")
    CODEC_TEST_ENTRY(Buffer, const Nimbo::Binary&, "buffer")
    // clang-format on
#undef CODEC_TEST_ENTRY
#undef CODEC_TEST_ARRAY
#undef CODEC_TEST_NUMBER

private:
    template <typename T>
    static std::string Join(const T* values, unsigned int count) {
        std::ostringstream text;
        text.precision(17);
        for (unsigned int i = 0; i < count; ++i) text << (i ? "," : "") << +values[i];
        return text.str();
    }
    template <typename T>
    static std::string Text(T value) {
        return Join(&value, 1);
    }
    static std::string Text(bool value) { return value ? "true" : "false"; }
    static std::string Text(const ZelUnicodeString& value) { return "'" + value.str() + "'"; }
    static std::string Text(const std::vector<ZelUnicodeString>& values) {
        std::string text;
        for (const auto& value : values) text += (text.empty() ? "" : ",") + Text(value);
        return "[" + text + "]";
    }
    std::string Text(const Nimbo::Binary& value) {
        buffer = value;
        return "'" + Str(value) + "'";
    }
    bool Log(const char* kind, const ZelUnicodeString& name, const std::string& value) {
        lines.push_back(std::string(kind) + " " + name.str() + "=" + value);
        return static_cast<int>(lines.size()) - 1 != refuseAt;
    }

    const int refuseAt;
    Nimbo::TypedBinaryWriter* const out;
};

#endif  // TESTS_CODEC_CODECTESTSUPPORT_H_
