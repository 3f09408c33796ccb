// Tarn::ParametersIterator: walks the own properties of a Parameters, kind by kind in kind order
// ("string", "bool", ... "objectArray") and by name within a kind, and descends into nested bags
// and object-array elements.
//
// The iterator owns its state (copies are independent) but not the bag it walks: it stays valid
// while that bag is neither changed nor destroyed. It only reads, so several iterators may walk one
// unchanging bag from several threads.
#ifndef TARN_PARAMETERSITERATOR_H_
#define TARN_PARAMETERSITERATOR_H_

#include "Tarn/Export.h"
#include "ZelUnicodeString.h"

namespace Tarn {

class Parameters;
class ParametersImpl;
struct ParametersIteratorState;

class TARN_EXPORT ParametersIterator {
public:
    enum EMode { AtBegin = 0, AtEnd = 1 };

    ParametersIterator(const ParametersIterator& other);
    ParametersIterator& operator=(const ParametersIterator& other);
    ~ParametersIterator();

    // Equal when both walk the same bag and stand on the same property, or are both at the end.
    bool operator==(const ParametersIterator& other) const;
    bool operator!=(const ParametersIterator& other) const { return !(*this == other); }
    ParametersIterator& operator++();
    ParametersIterator operator++(int);

    // Name and type name of the current property ("int32", a nested bag's object type, an object
    // array's element type followed by "[]").
    const ZelUnicodeString& GetName() const;
    const ZelUnicodeString& GetType() const;
    // The current value as JSON text; empty at the end. Always returns 0.
    long GetStringValue(ZelUnicodeString& value) const;

    bool IsObject() const;
    bool IsObjectArray() const;
    unsigned int GetObjectArraySize() const;
    // On a nested bag: its begin and end; elsewhere: the end of the bag being walked.
    ParametersIterator ObjectBegin() const;
    ParametersIterator ObjectEnd() const;
    // On an object array: begin and end of element `index`, which must be below the element count
    // (std::out_of_range otherwise); elsewhere the end of the bag being walked.
    ParametersIterator ObjectArrayBegin(unsigned int index) const;
    ParametersIterator ObjectArrayEnd(unsigned int index) const;

private:
    friend class Parameters;
    friend class ParametersIteratorAccess;
    ParametersIterator(const ParametersImpl& store, EMode mode);

    ParametersIteratorState* state_;
};

}  // namespace Tarn

#endif  // TARN_PARAMETERSITERATOR_H_
