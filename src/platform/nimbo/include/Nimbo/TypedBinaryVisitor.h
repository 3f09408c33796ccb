// Nimbo::TypedBinaryVisitor: receives the entries that TypedBinaryReader::Apply reads, one handler
// call per entry, in the order they were written.
//
// Each handler returns true when it stored the entry; false makes Apply stop and fail. The handler
// order below is the class's virtual-slot order and must not change.
//
// Array handlers are given storage allocated with new[] by the reader, and own it from the call
// on, whatever they return: they release it with delete[] (or keep it). The reader never looks at
// the pointer again. An empty array arrives as count 0 and a null pointer. A "bool" array holds one
// byte per element, exactly as written; non-zero means true.
//
// Buffer entries arrive as a slice sharing the decoded bytes (no copy); keep the Binary to keep
// the bytes.
#ifndef NIMBO_TYPEDBINARYVISITOR_H_
#define NIMBO_TYPEDBINARYVISITOR_H_

#include <vector>

#include "Nimbo/Binary.h"
#include "ZelUnicodeString.h"

namespace Nimbo {

class TypedBinaryVisitor {
public:
    virtual ~TypedBinaryVisitor() = default;

    virtual bool OnArrayDouble(const ZelUnicodeString& name, unsigned int count,
                               double*& array) = 0;
    virtual bool OnArrayFloat(const ZelUnicodeString& name, unsigned int count, float*& array) = 0;
    virtual bool OnArrayUint64(const ZelUnicodeString& name, unsigned int count,
                               unsigned long long*& array) = 0;
    virtual bool OnArrayInt64(const ZelUnicodeString& name, unsigned int count,
                              long long*& array) = 0;
    virtual bool OnArrayUint32(const ZelUnicodeString& name, unsigned int count,
                               unsigned int*& array) = 0;
    virtual bool OnArrayInt32(const ZelUnicodeString& name, unsigned int count, int*& array) = 0;
    virtual bool OnArrayUint16(const ZelUnicodeString& name, unsigned int count,
                               unsigned short*& array) = 0;
    virtual bool OnArrayInt16(const ZelUnicodeString& name, unsigned int count, short*& array) = 0;
    virtual bool OnArrayUint8(const ZelUnicodeString& name, unsigned int count,
                              unsigned char*& array) = 0;
    virtual bool OnArrayInt8(const ZelUnicodeString& name, unsigned int count,
                             signed char*& array) = 0;
    virtual bool OnArrayBool(const ZelUnicodeString& name, unsigned int count,
                             unsigned char*& array) = 0;
    virtual bool OnBuffer(const ZelUnicodeString& name, const Binary& value) = 0;
    virtual bool OnDouble(const ZelUnicodeString& name, double value) = 0;
    virtual bool OnFloat(const ZelUnicodeString& name, float value) = 0;
    virtual bool OnUint64(const ZelUnicodeString& name, unsigned long long value) = 0;
    virtual bool OnInt64(const ZelUnicodeString& name, long long value) = 0;
    virtual bool OnUint32(const ZelUnicodeString& name, unsigned int value) = 0;
    virtual bool OnInt32(const ZelUnicodeString& name, int value) = 0;
    virtual bool OnUint16(const ZelUnicodeString& name, unsigned short value) = 0;
    virtual bool OnInt16(const ZelUnicodeString& name, short value) = 0;
    virtual bool OnUint8(const ZelUnicodeString& name, unsigned char value) = 0;
    virtual bool OnInt8(const ZelUnicodeString& name, signed char value) = 0;
    virtual bool OnBool(const ZelUnicodeString& name, bool value) = 0;
    virtual bool OnStrings(const ZelUnicodeString& name,
                           const std::vector<ZelUnicodeString>& values) = 0;
    virtual bool OnString(const ZelUnicodeString& name, const ZelUnicodeString& value) = 0;
};

}  // namespace Nimbo

#endif  // NIMBO_TYPEDBINARYVISITOR_H_
