// Prints how many nanoseconds it takes to load the library named on the command line, with all its symbols
// bound. The libraries that it needs are linked to this program, so that they are there already. Each process
// loads once: a library with unique symbols stays for good.
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>

int main(int argc, char** argv) {
    if (argc != 2) {
        return EXIT_FAILURE;
    }
    const auto start = std::chrono::steady_clock::now();
    const void* const library = dlopen(argv[1], RTLD_NOW | RTLD_LOCAL);
    const std::chrono::nanoseconds time = std::chrono::steady_clock::now() - start;
    if (library == nullptr || std::printf("%lld\n", static_cast<long long>(time.count())) < 0) {
        return EXIT_FAILURE;
    }
    return EXIT_SUCCESS;
}
