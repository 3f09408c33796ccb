#include "Nimbo/Binary.h"

#include <cstring>

namespace Nimbo {

void deallocateArrayChar(const void* data) { delete[] static_cast<const char*>(data); }

void noDeallocate(const void*) {}

struct Binary::Block {
    Block(const void* d, Deallocator f) : data(d), deallocate(f) {}
    ~Block() {
        if (deallocate != nullptr) deallocate(data);
    }
    Block(const Block&) = delete;
    Block& operator=(const Block&) = delete;

    const void* data;
    Deallocator deallocate;
};

Binary::Binary(const void* data, unsigned int size, Deallocator deallocate) {
    if (data == nullptr) return;
    block_ = std::make_shared<const Block>(data, deallocate);
    data_ = data;
    size_ = size;
}

bool Binary::IsEqual(const char* data, unsigned int size) const {
    if (size != size_) return false;
    if (size == 0) return true;
    return data != nullptr && std::memcmp(data_, data, size) == 0;
}

Binary Binary::Slice(unsigned int offset, unsigned int size) const {
    Binary slice;
    if (offset >= size_) return slice;
    if (size > size_ - offset) size = size_ - offset;
    if (size == 0) return slice;
    slice.block_ = block_;
    slice.data_ = static_cast<const char*>(data_) + offset;
    slice.size_ = size;
    return slice;
}

}  // namespace Nimbo
