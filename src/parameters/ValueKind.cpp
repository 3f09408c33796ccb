#include "parameters/ValueKind.h"

namespace Tarn {
namespace {

const char* const kNames[kKindCount + 1] = {
    "",        "string",   "bool",     "int8",     "uint8",    "int16",    "uint16",
    "int32",   "uint32",   "int64",    "uint64",   "float",    "double",   "buffer",
    "object",  "string[]", "bool[]",   "int8[]",   "uint8[]",  "int16[]",  "uint16[]",
    "int32[]", "uint32[]", "int64[]",  "uint64[]", "float[]",  "double[]", "objectArray",
};

}  // namespace

const char* KindName(ValueKind kind) {
    int index = static_cast<int>(kind);
    return index >= 0 && index <= kKindCount ? kNames[index] : "";
}

ValueKind KindOfTypeName(const ZelUnicodeString& typeName) {
    for (int i = 1; i <= kKindCount; ++i) {
        if (typeName == kNames[i]) return static_cast<ValueKind>(i);
    }
    return ValueKind::None;
}

bool IsObjectArrayTypeName(const ZelUnicodeString& typeName) {
    return KindOfTypeName(typeName) == ValueKind::None && typeName.SearchSubString("[]") >= 0;
}

bool IsObjectTypeName(const ZelUnicodeString& typeName) {
    return KindOfTypeName(typeName) == ValueKind::None && typeName.SearchSubString("[]") < 0;
}

bool IsBuiltInTypeName(const ZelUnicodeString& typeName) {
    if (typeName == "Parameters") return true;
    ValueKind kind = KindOfTypeName(typeName);
    return kind != ValueKind::None && kind != ValueKind::Object && kind != ValueKind::ObjectArray;
}

ZelUnicodeString ElementTypeName(const ZelUnicodeString& objectArrayTypeName) {
    ZelUnicodeString element = objectArrayTypeName;
    element.ReplaceAll("[]", "");
    return element;
}

}  // namespace Tarn
