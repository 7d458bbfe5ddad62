// The main function of the test programs: under the locale of the environment, as a CIM server runs.
#include <clocale>
#include <gtest/gtest.h>

// The C library's newlocale does not free its copy of LOCPATH when it runs out of memory.
#pragma GCC visibility push(default)                   // where the sanitizer finds it
extern "C" const char* __lsan_default_suppressions();  // NOLINT(bugprone-reserved-identifier,cert-*)
extern "C" const char* __lsan_default_suppressions() { // NOLINT(bugprone-reserved-identifier,cert-*)
    return "leak:__argz_add_sep\n";
}
#pragma GCC visibility pop

int main(int argc, char** argv) {
    std::setlocale(LC_ALL, "");
    testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}
