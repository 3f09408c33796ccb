// Tarn::Parameters: a bag of named, typed properties with an object type.
//
// Each property has one of 27 value kinds ("string", "bool", "int8" ... "double", "buffer",
// "object", "string[]" ... "double[]", "objectArray"); the same name may be held under several
// kinds at once, and each reader only looks at its own kind. Reads and existence tests fall back
// to a linked bag of default values, which the bag never owns or changes.
//
// A Parameters owns its values and nested bags; copies are deep. It is bound to the registry it
// was created from, through which it publishes its error texts and converts typed objects. It takes
// no lock: one Parameters must not be used from two threads at once; distinct bags are independent.
#ifndef TARN_PARAMETERS_H_
#define TARN_PARAMETERS_H_

#include <vector>

#include "Nimbo/Binary.h"
#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class Binary;
class Commands;
class ParametersImpl;
class ParametersInternal;
class ParametersIterator;
class Types;
class TypesImpl;

class TARN_EXPORT Parameters {
public:
    explicit Parameters(const Commands& commands);
    explicit Parameters(const Types& types);
    // Decode `bytes`; a bag whose bytes fail to decode holds what was decoded before the failure,
    // and is empty when the header is wrong.
    Parameters(const Types& types, const Binary& bytes);
    Parameters(const Types& types, const Nimbo::Binary& bytes);
    Parameters(const Commands& commands, const Binary& bytes);
    Parameters(const Commands& commands, const Nimbo::Binary& bytes);
    // A deep copy: every property and the object type, without the defaults link.
    Parameters(const Parameters& other);
    ~Parameters();
    Parameters& operator=(const Parameters&) = delete;

    const ZelUnicodeString& GetObjectType() const;
    // Checks the bag against the declared type and takes that type; "Parameters" needs no check.
    long DeclareAsObject(const ZelUnicodeString& typeName);
    void DeclareAsParameters();

    // Existence here or along the defaults chain; `type` receives the reported type.
    bool Exists(const ZelUnicodeString& name) const;
    bool Exists(const ZelUnicodeString& name, ZelUnicodeString& type) const;
    bool ExistsWithType(const ZelUnicodeString& name, const ZelUnicodeString& typeName) const;
    // The same tests on this bag alone.
    bool HasOwnTarnProperty(const ZelUnicodeString& name) const;
    bool hasOwnTarnProperty(const ZelUnicodeString& name) const;
    bool HasOwnTarnProperty(const ZelUnicodeString& name, ZelUnicodeString& type) const;
    bool HasOwnTarnPropertyWithType(const ZelUnicodeString& name,
                                    const ZelUnicodeString& typeName) const;
    // Removes the name from every kind; true when one held it.
    bool RemoveProperty(const ZelUnicodeString& name);
    bool IsEmpty() const;

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

    // The bytes are always copied. A null `data` with a non-zero size fails.
    long WriteBuffer(const ZelUnicodeString& name, const void* data, unsigned int size);
    long WriteBuffer(const ZelUnicodeString& name, const Binary& value);
    long WriteBuffer(const ZelUnicodeString& name, const Nimbo::Binary& value);

    // The pointer forms copy `count` elements; a null pointer with a non-zero count fails.
    long WriteStringArray(const ZelUnicodeString& name, const std::vector<ZelUnicodeString>& values);
    long WriteStringArray(const ZelUnicodeString& name, ZelUnicodeString* values,
                          unsigned int count);
    long WriteBoolArray(const ZelUnicodeString& name, const std::vector<bool>& values);
    long WriteBoolArray(const ZelUnicodeString& name, bool* values, unsigned int count);
    long WriteInt8Array(const ZelUnicodeString& name, const std::vector<signed char>& values);
    long WriteInt8Array(const ZelUnicodeString& name, signed char* values, unsigned int count);
    long WriteUint8Array(const ZelUnicodeString& name, const std::vector<unsigned char>& values);
    long WriteUint8Array(const ZelUnicodeString& name, unsigned char* values, unsigned int count);
    long WriteInt16Array(const ZelUnicodeString& name, const std::vector<short>& values);
    long WriteInt16Array(const ZelUnicodeString& name, short* values, unsigned int count);
    long WriteUint16Array(const ZelUnicodeString& name, const std::vector<unsigned short>& values);
    long WriteUint16Array(const ZelUnicodeString& name, unsigned short* values,
                          unsigned int count);
    long WriteInt32Array(const ZelUnicodeString& name, const std::vector<int>& values);
    long WriteInt32Array(const ZelUnicodeString& name, int* values, unsigned int count);
    long WriteUint32Array(const ZelUnicodeString& name, const std::vector<unsigned int>& values);
    long WriteUint32Array(const ZelUnicodeString& name, unsigned int* values, unsigned int count);
    long WriteInt64Array(const ZelUnicodeString& name, const std::vector<long long>& values);
    long WriteInt64Array(const ZelUnicodeString& name, long long* values, unsigned int count);
    long WriteUint64Array(const ZelUnicodeString& name,
                          const std::vector<unsigned long long>& values);
    long WriteUint64Array(const ZelUnicodeString& name, unsigned long long* values,
                          unsigned int count);
    long WriteFloatArray(const ZelUnicodeString& name, const std::vector<float>& values);
    long WriteFloatArray(const ZelUnicodeString& name, float* values, unsigned int count);
    long WriteDoubleArray(const ZelUnicodeString& name, const std::vector<double>& values);
    long WriteDoubleArray(const ZelUnicodeString& name, double* values, unsigned int count);

    // Stores a deep copy of `value` as the nested bag `name`.
    long WriteParameters(const ZelUnicodeString& name, const Parameters& value);

    long ReadString(const ZelUnicodeString& name, ZelUnicodeString& value) const;
    long ReadBool(const ZelUnicodeString& name, bool& value) const;
    long ReadInt8(const ZelUnicodeString& name, signed char& value) const;
    long ReadUint8(const ZelUnicodeString& name, unsigned char& value) const;
    long ReadInt16(const ZelUnicodeString& name, short& value) const;
    long ReadUint16(const ZelUnicodeString& name, unsigned short& value) const;
    long ReadInt32(const ZelUnicodeString& name, int& value) const;
    long ReadUint32(const ZelUnicodeString& name, unsigned int& value) const;
    long ReadInt64(const ZelUnicodeString& name, long long& value) const;
    long ReadUint64(const ZelUnicodeString& name, unsigned long long& value) const;
    long ReadFloat(const ZelUnicodeString& name, float& value) const;
    long ReadDouble(const ZelUnicodeString& name, double& value) const;
    // `data` points at the stored bytes (no copy), valid until the property changes.
    long ReadBuffer(const ZelUnicodeString& name, const void*& data, unsigned int& size) const;

    long ReadStringArray(const ZelUnicodeString& name, std::vector<ZelUnicodeString>& values) const;
    long ReadBoolArray(const ZelUnicodeString& name, std::vector<bool>& values) const;
    long ReadInt8Array(const ZelUnicodeString& name, std::vector<signed char>& values) const;
    long ReadUint8Array(const ZelUnicodeString& name, std::vector<unsigned char>& values) const;
    long ReadInt16Array(const ZelUnicodeString& name, std::vector<short>& values) const;
    long ReadUint16Array(const ZelUnicodeString& name, std::vector<unsigned short>& values) const;
    long ReadInt32Array(const ZelUnicodeString& name, std::vector<int>& values) const;
    long ReadUint32Array(const ZelUnicodeString& name, std::vector<unsigned int>& values) const;
    long ReadInt64Array(const ZelUnicodeString& name, std::vector<long long>& values) const;
    long ReadUint64Array(const ZelUnicodeString& name,
                         std::vector<unsigned long long>& values) const;
    long ReadFloatArray(const ZelUnicodeString& name, std::vector<float>& values) const;
    long ReadDoubleArray(const ZelUnicodeString& name, std::vector<double>& values) const;

    // Copies the nested bag `name` of object type `typeName` into `out`.
    long ReadParameters(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                        Parameters& out) const;
    // A new deep copy of the nested bag `name` (object type "Parameters"); the caller deletes it.
    long ReadParameters(const ZelUnicodeString& name, Parameters*& out) const;

    // Typed application objects, converted through the registry.
    long WriteObject(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                     const void* object);
    long WriteObjectArray(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                          const std::vector<const void*>& objects);
    long ReadObject(const ZelUnicodeString& name, const ZelUnicodeString& typeName,
                    void*& object) const;

    Nimbo::Binary ToBinary() const;
    long ToJSON(ZelUnicodeString& text) const;
    ParametersIterator Begin() const;
    ParametersIterator End() const;

private:
    friend class ParametersInternal;

    Parameters(const TypesImpl& types, const ZelUnicodeString& objectType);
    long FromBinary(const Nimbo::Binary& bytes);

    ParametersImpl* impl_;
};

}  // namespace Tarn

#endif  // TARN_PARAMETERS_H_
