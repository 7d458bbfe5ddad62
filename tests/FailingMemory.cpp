#include "FailingMemory.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <execinfo.h>
#include <new>

namespace {

struct State {
    bool counts = false;
    unsigned int first = 0; // 0: none
    bool once = false;
    unsigned int asked = 0;
    unsigned int failed = 0;
    std::array<void*, 64> stack{}; // of the first failure
    int depth = 0;
};
thread_local State state;

void begin(unsigned int first, bool once) {
    state.first = first;
    state.once = once;
    state.asked = 0;
    state.failed = 0;
    state.counts = true;
}

void* allocate(std::size_t size) {
    if (state.counts) {
        ++state.asked;
        const bool fails =
            state.first != 0 && (state.once ? state.asked == state.first : state.asked >= state.first);
        if (fails) {
            if (state.failed++ == 0) {
                state.depth = ::backtrace(state.stack.data(), static_cast<int>(state.stack.size()));
            }
            return nullptr;
        }
    }
    return std::malloc(size != 0 ? size : 1);
}

void* allocateOrThrow(std::size_t size) {
    void* const block = allocate(size);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

} // namespace

void failing::allocation(unsigned int n) {
    begin(n, true);
}

void failing::allocationsFrom(unsigned int n) {
    begin(n, false);
}

bool failing::ended() {
    state.counts = false;
    return state.failed != 0;
}

unsigned int failing::allocations() {
    return state.asked;
}

bool failing::failedIn(const char* name) {
    return state.failed != 0 &&
           std::any_of(state.stack.begin(), state.stack.begin() + state.depth, [name](const void* frame) {
               Dl_info info{};
               return ::dladdr(frame, &info) != 0 && std::strstr(info.dli_fname, name) != nullptr;
           });
}

void* operator new(std::size_t size) {
    return allocateOrThrow(size);
}

void* operator new[](std::size_t size) {
    return allocateOrThrow(size);
}

void* operator new(std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
    return allocate(size);
}

void* operator new[](std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
    return allocate(size);
}

void operator delete(void* block) noexcept {
    std::free(block);
}

void operator delete(void* block, std::size_t /*size*/) noexcept {
    std::free(block);
}

void operator delete[](void* block) noexcept {
    std::free(block);
}

void operator delete[](void* block, std::size_t /*size*/) noexcept {
    std::free(block);
}
