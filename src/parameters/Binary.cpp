#include "Tarn/Binary.h"

#include "Tarn/Parameters.h"

namespace Tarn {

void deallocateArrayChar(const void* data) { Nimbo::deallocateArrayChar(data); }

void noDeallocate(const void* data) { Nimbo::noDeallocate(data); }

Binary::Binary() : binary_(new Nimbo::Binary()) {}

Binary::Binary(const void* data, unsigned int size, void (*deallocate)(const void*))
    : binary_(new Nimbo::Binary(data, size, deallocate)) {}

Binary::Binary(const Nimbo::Binary& other) : binary_(new Nimbo::Binary(other)) {}

Binary::Binary(const Binary& other) : binary_(new Nimbo::Binary(*other.binary_)) {}

Binary::~Binary() { delete binary_; }

Binary& Binary::operator=(const Binary& other) {
    *binary_ = *other.binary_;
    return *this;
}

bool Binary::operator==(const Binary& other) const { return *binary_ == *other.binary_; }

bool Binary::operator!=(const Binary& other) const { return *binary_ != *other.binary_; }

Binary::operator Nimbo::Binary() const { return *binary_; }

const void* Binary::GetData() const { return binary_->GetData(); }

unsigned int Binary::GetSize() const { return binary_->GetSize(); }

bool Binary::IsEqual(const char* data, unsigned int size) const {
    return binary_->IsEqual(data, size);
}

long Parameters::WriteBuffer(const ZelUnicodeString& name, const Binary& value) {
    return WriteBuffer(name, value.GetData(), value.GetSize());
}

}  // namespace Tarn
