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
    const void* asker = nullptr; // where in it operator new was called
};
thread_local State state;

void begin(unsigned int first, bool once) {
    state.first = first;
    state.once = once;
    state.asked = 0;
    state.failed = 0;
    state.counts = true;
}

void* allocate(std::size_t size, const void* asker) {
    if (state.counts) {
        ++state.asked;
        const bool fails =
            state.first != 0 && (state.once ? state.asked == state.first : state.asked >= state.first);
        if (fails) {
            if (state.failed++ == 0) {
                state.asker = asker;
                state.depth = ::backtrace(state.stack.data(), static_cast<int>(state.stack.size()));
            }
            return nullptr;
        }
    }
    return std::malloc(size != 0 ? size : 1);
}

void* allocateOrThrow(std::size_t size, const void* asker) {
    void* const block = allocate(size, asker);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

// Whether a function is the C++ library's: its own, or a template of its. All libraries of a process share
// one copy of such a template, wherever it lies.
bool isStandard(const Dl_info& info) {
    constexpr std::array<const char*, 4> prefixes = {"_ZNSt", "_ZNKSt", "_ZSt", "_ZN9__gnu_cxx"};
    return std::strstr(info.dli_fname, "libstdc++") != nullptr ||
           std::any_of(prefixes.begin(), prefixes.end(), [&info](const char* prefix) {
               return info.dli_sname != nullptr &&
                      std::strncmp(info.dli_sname, prefix, std::strlen(prefix)) == 0;
           });
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
    void* const* const begin = state.stack.data();
    void* const* const end = begin + (state.failed != 0 ? state.depth : 0);
    for (void* const* frame = std::find(begin, end, state.asker); frame != end; ++frame) {
        Dl_info info{};
        if (::dladdr(*frame, &info) != 0 && !isStandard(info)) {
            return std::strstr(info.dli_fname, name) != nullptr;
        }
    }
    return false;
}

void* operator new(std::size_t size) {
    return allocateOrThrow(size, __builtin_return_address(0));
}

void* operator new[](std::size_t size) {
    return allocateOrThrow(size, __builtin_return_address(0));
}

void* operator new(std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
    return allocate(size, __builtin_return_address(0));
}

void* operator new[](std::size_t size, const std::nothrow_t& /*nothrow*/) noexcept {
    return allocate(size, __builtin_return_address(0));
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
