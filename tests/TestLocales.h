// Locales for one thread: the system's "C" and "C.UTF-8" and those of make-locales.
#pragma once

#include <clocale>
#include <cstdlib>
#include <gtest/gtest.h>
#include <locale.h>

// Before there are threads. TEST_LOCALES is the folder that make-locales has filled; LANGUAGE would have a
// say in what language a localised text is in.
inline const bool testLocalesAreFound =
    ::setenv("LOCPATH", TEST_LOCALES, 1) == 0 && ::unsetenv("LANGUAGE") == 0;

// The leak sanitizer's, where there is one.
extern "C" void __lsan_disable() __attribute__((weak));
extern "C" void __lsan_enable() __attribute__((weak));

// Puts the calling thread into a locale while it lives. `mask` says for which categories; the others stay
// "C".
class ThreadLocale {
public:
    explicit ThreadLocale(const char* name, int mask = LC_ALL_MASK) {
        // The C library's newlocale loses the list that it makes of LOCPATH.
        if (__lsan_disable != nullptr) {
            __lsan_disable();
        }
        locale_ = ::newlocale(mask, name, nullptr);
        if (__lsan_enable != nullptr) {
            __lsan_enable();
        }
        if (locale_ == nullptr) {
            ADD_FAILURE() << "no locale " << name;
            return;
        }
        earlier_ = ::uselocale(locale_);
    }
    ~ThreadLocale() {
        if (locale_ != nullptr) {
            ::uselocale(earlier_);
            ::freelocale(locale_);
        }
    }
    ThreadLocale(const ThreadLocale&) = delete;
    ThreadLocale& operator=(const ThreadLocale&) = delete;

private:
    locale_t locale_ = nullptr;
    locale_t earlier_ = nullptr;
};
