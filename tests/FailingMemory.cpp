#include "FailingMemory.h"

#include <cstddef>
#include <cstdlib>
#include <new>

namespace {

thread_local unsigned int failingFrom = 0;
thread_local unsigned int asked = 0;

} // namespace

void failing::allocationsFrom(unsigned int n) {
    failingFrom = n;
    asked = 0;
}

unsigned int failing::allocations() {
    return asked;
}

void* operator new(std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
    ++asked;
    return failingFrom != 0 && asked >= failingFrom ? nullptr : std::malloc(size != 0 ? size : 1);
}

void* operator new(std::size_t size) {
    void* const block = operator new(size, std::nothrow);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

void operator delete(void* block) noexcept {
    std::free(block);
}

void operator delete(void* block, std::size_t /*size*/) noexcept {
    std::free(block);
}
