/**
 * @file
 * TK::Locale, the current language and the resource libraries with its texts.
 *
 * **Threads.** Everything here may be called from any thread at any time, but not while another thread calls
 * `setlocale`.
 */
#pragma once

#include "TKExport.h"

#include <string>

namespace TK {

/** The locale. All members are static. */
class TK_EXPORT Locale {
public:
    Locale() = delete;

    /**
     * The language of the calling thread's `LC_MESSAGES`, the one that `uselocale` or else `setlocale` has
     * chosen: a language code, with territory and modifier where the locale's name has them ("de_DE",
     * "sr_RS@latin"). It is "en" when none was chosen ("C", "POSIX").
     * @throws std::bad_alloc
     */
    static std::string getLanguageId();

    /**
     * The name of a resource library, a set of localised texts; TK::ResourceString takes it. One library
     * holds the texts of all languages, so its name depends on the number alone.
     * @param number 2 for the texts of the providers; there is no other library.
     * @param languageId the language, ASCII.
     * @return the name, empty when there is no such library.
     * @throws std::bad_alloc
     */
    static std::wstring getResourceLibrary(unsigned long number, std::string languageId);
};

} // namespace TK
