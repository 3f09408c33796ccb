// Nimbo::Binary: an immutable block of bytes, shared between copies.
//
// The bytes are released once, by the deallocator given with them, when the last copy (or slice)
// goes away. Copies and slices are cheap: they share the block and never copy bytes. A Binary may
// be copied and read from any number of threads at once; one object must not be assigned from two
// threads at once.
#ifndef NIMBO_BINARY_H_
#define NIMBO_BINARY_H_

#include <memory>

namespace Nimbo {

// Releases bytes allocated with new char[].
void deallocateArrayChar(const void* data);
// Leaves the bytes with their owner.
void noDeallocate(const void* data);

using Deallocator = void (*)(const void*);

class Binary {
public:
    // An empty block: null data, size 0.
    Binary() = default;
    // Wraps `size` bytes at `data`; `deallocate` (may be null for none) releases them once no copy
    // is left. A null `data` gives an empty block whatever `size` says.
    Binary(const void* data, unsigned int size, Deallocator deallocate);

    Binary(const Binary&) = default;
    Binary(Binary&&) noexcept = default;
    Binary& operator=(const Binary&) = default;
    Binary& operator=(Binary&&) noexcept = default;
    ~Binary() = default;

    const void* GetData() const { return data_; }
    unsigned int GetSize() const { return size_; }
    bool IsEmpty() const { return size_ == 0; }

    // Byte equality with `size` bytes at `data` (a null `data` only equals an empty block).
    bool IsEqual(const char* data, unsigned int size) const;
    bool operator==(const Binary& other) const {
        return IsEqual(static_cast<const char*>(other.data_), other.size_);
    }
    bool operator!=(const Binary& other) const { return !(*this == other); }

    // The `size` bytes from `offset` on, sharing this block. Out-of-range requests are clipped to
    // the bytes that exist.
    Binary Slice(unsigned int offset, unsigned int size) const;

private:
    struct Block;
    std::shared_ptr<const Block> block_;
    const void* data_ = nullptr;
    unsigned int size_ = 0;
};

}  // namespace Nimbo

#endif  // NIMBO_BINARY_H_
