// Tarn::Binary: the library's handle on a block of bytes (a kernel Nimbo::Binary).
//
// The handle owns its Nimbo::Binary; the bytes themselves are immutable and shared between copies,
// and released once, by the deallocator given with them, when the last copy goes. Copies may be
// used from several threads; one handle must not be assigned from two threads at once.
#ifndef TARN_BINARY_H_
#define TARN_BINARY_H_

#include "Nimbo/Binary.h"
#include "Tarn/Export.h"

namespace Tarn {

// Releases bytes allocated with new char[]: hand it over with such bytes.
TARN_EXPORT void deallocateArrayChar(const void* data);
// Leaves the bytes with their owner, who keeps them alive as long as any copy exists.
TARN_EXPORT void noDeallocate(const void* data);

class TARN_EXPORT Binary {
public:
    Binary();
    Binary(const void* data, unsigned int size, void (*deallocate)(const void*));
    Binary(const Nimbo::Binary& other);  // NOLINT: converts from the kernel's buffer
    Binary(const Binary& other);
    ~Binary();
    Binary& operator=(const Binary& other);

    bool operator==(const Binary& other) const;
    bool operator!=(const Binary& other) const;
    operator Nimbo::Binary() const;  // NOLINT

    const void* GetData() const;
    unsigned int GetSize() const;
    bool IsEqual(const char* data, unsigned int size) const;

private:
    Nimbo::Binary* binary_;
};

}  // namespace Tarn

#endif  // TARN_BINARY_H_
