// Helpers shared by the codec tests: byte literals, a visitor that logs what it receives, and one
// that writes every entry it receives back out.
#ifndef TESTS_CODEC_CODECTESTSUPPORT_H_
#define TESTS_CODEC_CODECTESTSUPPORT_H_

#include <cstdio>
#include <cstring>
#include <initializer_list>
#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "Nimbo/Binary.h"
#include "Nimbo/TypedBinaryVisitor.h"
#include "Nimbo/TypedBinaryWriter.h"

namespace codec_test {

// A Binary holding a copy of `bytes` (each 0..255).
inline Nimbo::Binary Bytes(std::initializer_list<int> bytes) {
    char* data = new char[bytes.size() + 1];
    unsigned int size = 0;
    for (int b : bytes) data[size++] = static_cast<char>(b);
    return Nimbo::Binary(data, size, Nimbo::deallocateArrayChar);
}

// A copy in a block of exactly `size` bytes, so that AddressSanitizer catches a read past it.
inline Nimbo::Binary Copy(const void* data, unsigned int size) {
    char* copy = new char[size];
    if (size > 0) std::memcpy(copy, data, size);
    return Nimbo::Binary(copy, size, Nimbo::deallocateArrayChar);
}

// The first `size` bytes of `binary`, copied alone.
inline Nimbo::Binary Prefix(const Nimbo::Binary& binary, unsigned int size) {
    return Copy(binary.GetData(), size);
}

inline std::string Hex(const Nimbo::Binary& binary) {
    std::string text;
    const auto* data = static_cast<const unsigned char*>(binary.GetData());
    for (unsigned int i = 0; i < binary.GetSize(); ++i) {
        char byte[4];
        std::snprintf(byte, sizeof byte, "%02x ", data[i]);
        text += byte;
    }
    return text;
}

// Calls X(Handler, writer call, value type, log label) for each scalar kind, and
// A(Handler, writer call, element type, log label) for each array kind.
#define CODEC_TEST_SCALARS(X)                              \
    X(OnDouble, WriteDouble, double, "double")             \
    X(OnFloat, WriteFloat, float, "float")                 \
    X(OnUint64, WriteUint64, unsigned long long, "uint64") \
    X(OnInt64, WriteInt64, long long, "int64")             \
    X(OnUint32, WriteUint32, unsigned int, "uint32")       \
    X(OnInt32, WriteInt32, int, "int32")                   \
    X(OnUint16, WriteUint16, unsigned short, "uint16")     \
    X(OnInt16, WriteInt16, short, "int16")                 \
    X(OnUint8, WriteUint8, unsigned char, "uint8")         \
    X(OnInt8, WriteInt8, signed char, "int8")
#define CODEC_TEST_ARRAYS(A)                                           \
    A(OnArrayDouble, WriteArrayDouble, double, "double[]")             \
    A(OnArrayFloat, WriteArrayFloat, float, "float[]")                 \
    A(OnArrayUint64, WriteArrayUint64, unsigned long long, "uint64[]") \
    A(OnArrayInt64, WriteArrayInt64, long long, "int64[]")             \
    A(OnArrayUint32, WriteArrayUint32, unsigned int, "uint32[]")       \
    A(OnArrayInt32, WriteArrayInt32, int, "int32[]")                   \
    A(OnArrayUint16, WriteArrayUint16, unsigned short, "uint16[]")     \
    A(OnArrayInt16, WriteArrayInt16, short, "int16[]")                 \
    A(OnArrayUint8, WriteArrayUint8, unsigned char, "uint8[]")         \
    A(OnArrayInt8, WriteArrayInt8, signed char, "int8[]")              \
    A(OnArrayBool, WriteArrayBool, unsigned char, "bool[]")

// Logs each entry as one line, e.g. "int32 n=-5" or "int16[] a=[1,2]" ("null" for a null array),
// releases every array it is given, and refuses (returns false on) the call numbered `refuseAt`.
class Recorder : public Nimbo::TypedBinaryVisitor {
public:
    std::vector<std::string> lines;
    int refuseAt = -1;

#define CODEC_TEST_LOG_SCALAR(Handler, Write, T, label) \
    bool Handler(const ZelUnicodeString& n, T v) override { return Scalar(label, n, +v); }
#define CODEC_TEST_LOG_ARRAY(Handler, Write, T, label)                        \
    bool Handler(const ZelUnicodeString& n, unsigned int c, T*& a) override { \
        return Array(label, n, c, a);                                         \
    }
    CODEC_TEST_SCALARS(CODEC_TEST_LOG_SCALAR)
    CODEC_TEST_ARRAYS(CODEC_TEST_LOG_ARRAY)
#undef CODEC_TEST_LOG_SCALAR
#undef CODEC_TEST_LOG_ARRAY

    bool OnBuffer(const ZelUnicodeString& n, const Nimbo::Binary& v) override {
        return Log("buffer", n,
                   "'" + std::string(static_cast<const char*>(v.GetData()), v.GetSize()) + "'");
    }
    bool OnBool(const ZelUnicodeString& n, bool v) override {
        return Log("bool", n, v ? "true" : "false");
    }
    bool OnStrings(const ZelUnicodeString& n, const std::vector<ZelUnicodeString>& v) override {
        std::string text = "[";
        for (size_t i = 0; i < v.size(); ++i) text += (i ? ",'" : "'") + v[i].str() + "'";
        return Log("string[]", n, text + "]");
    }
    bool OnString(const ZelUnicodeString& n, const ZelUnicodeString& v) override {
        return Log("string", n, "'" + v.str() + "'");
    }

private:
    bool Log(const char* kind, const ZelUnicodeString& name, const std::string& value) {
        lines.push_back(std::string(kind) + " " + name.str() + "=" + value);
        return static_cast<int>(lines.size()) - 1 != refuseAt;
    }
    template <typename T>
    bool Scalar(const char* kind, const ZelUnicodeString& name, T value) {
        std::ostringstream text;
        text.precision(17);
        text << value;
        return Log(kind, name, text.str());
    }
    template <typename T>
    bool Array(const char* kind, const ZelUnicodeString& name, unsigned int count, T*& array) {
        std::ostringstream text;
        text.precision(17);
        if (array == nullptr) {
            text << "null";
        } else {
            text << "[";
            for (unsigned int i = 0; i < count; ++i) text << (i ? "," : "") << +array[i];
            text << "]";
        }
        delete[] array;
        array = nullptr;
        return Log(kind, name, text.str());
    }
};

// Writes every entry it receives to `out`, so that decoding a block and writing it back can be
// compared byte for byte with the block.
class Reencoder : public Nimbo::TypedBinaryVisitor {
public:
    Nimbo::TypedBinaryWriter out;

#define CODEC_TEST_WRITE_SCALAR(Handler, Write, T, label) \
    bool Handler(const ZelUnicodeString& n, T v) override { return out.Write(n, v) >= 0; }
#define CODEC_TEST_WRITE_ARRAY(Handler, Write, T, label)                      \
    bool Handler(const ZelUnicodeString& n, unsigned int c, T*& a) override { \
        const long result = out.Write(n, a, c);                               \
        delete[] a;                                                           \
        a = nullptr;                                                          \
        return result >= 0;                                                   \
    }
    CODEC_TEST_SCALARS(CODEC_TEST_WRITE_SCALAR)
    CODEC_TEST_ARRAYS(CODEC_TEST_WRITE_ARRAY)
#undef CODEC_TEST_WRITE_SCALAR
#undef CODEC_TEST_WRITE_ARRAY

    bool OnBuffer(const ZelUnicodeString& n, const Nimbo::Binary& v) override {
        return out.WriteBuffer(n, v) >= 0;
    }
    bool OnBool(const ZelUnicodeString& n, bool v) override { return out.WriteBool(n, v) >= 0; }
    bool OnStrings(const ZelUnicodeString& n, const std::vector<ZelUnicodeString>& v) override {
        return out.WriteStrings(n, v) >= 0;
    }
    bool OnString(const ZelUnicodeString& n, const ZelUnicodeString& v) override {
        return out.WriteString(n, v) >= 0;
    }
};

}  // namespace codec_test

#endif  // TESTS_CODEC_CODECTESTSUPPORT_H_
