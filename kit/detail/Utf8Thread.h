// The locale that a provider's functions run under.
#pragma once

#include "../Refusal.h"

#include <clocale>
#include <locale.h> // NOLINT(modernize-deprecated-headers): POSIX's locale_t

namespace oxahv::detail {

// A locale with UTF-8 as the encoding of texts, as CIM has it, and otherwise like another one.
inline ::locale_t utf8Locale(::locale_t like) {
    const ::locale_t copy = ::duplocale(like);
    const ::locale_t made =
        copy != nullptr ? ::newlocale(LC_CTYPE_MASK, "C.UTF-8", copy) : static_cast<::locale_t>(nullptr);
    if (made == nullptr) {
        if (copy != nullptr) {
            ::freelocale(copy);
        }
        throw Refusal(CMPI_RC_ERR_FAILED, "there is no locale C.UTF-8");
    }
    return made;
}

// The one for threads without a locale of their own. Making a locale costs more than a whole request, so each
// provider keeps it.
class Utf8Locale {
public:
    Utf8Locale() : locale_(utf8Locale(LC_GLOBAL_LOCALE)) {}
    ~Utf8Locale() { ::freelocale(locale_); }
    Utf8Locale(const Utf8Locale&) = delete;
    Utf8Locale& operator=(const Utf8Locale&) = delete;
    ::locale_t get() const { return locale_; }

private:
    ::locale_t locale_;
};

// Gives the calling thread a locale with UTF-8 for as long as the object lives. The thread is the server's: a
// locale of its own keeps its other categories.
class Utf8Thread {
public:
    explicit Utf8Thread(const Utf8Locale& shared) : previous_(::uselocale(nullptr)) {
        if (previous_ != LC_GLOBAL_LOCALE && previous_ != shared.get()) {
            own_ = utf8Locale(previous_);
        }
        ::uselocale(own_ != nullptr ? own_ : shared.get());
    }
    ~Utf8Thread() {
        ::uselocale(previous_);
        if (own_ != nullptr) {
            ::freelocale(own_);
        }
    }
    Utf8Thread(const Utf8Thread&) = delete;
    Utf8Thread& operator=(const Utf8Thread&) = delete;

private:
    ::locale_t previous_;
    ::locale_t own_ = nullptr;
};

} // namespace oxahv::detail
