/**
 * @file
 * TK::ResourceString, one localised text.
 *
 * @code
 * const std::wstring library = TK::Locale::getResourceLibrary(2, TK::Locale::getLanguageId());
 * const std::wstring text = TK::ResourceString(library, L"Operating system"); // German: "Betriebssystem"
 * @endcode
 *
 * **Threads.** An object is used by one thread at a time; objects can be created in all threads at once, but
 * not while another thread calls `setlocale`.
 */
#pragma once

#include "TKExport.h"

#include <string>

namespace TK {

/** Holds the text that a key stands for in the language of the thread that created the object. */
class TK_EXPORT ResourceString {
public:
    /**
     * Looks up a text in the language of the calling thread's `LC_MESSAGES` (see Locale::getLanguageId), or
     * in one that the environment variable `LANGUAGE` prefers to it. The text does not depend on `LC_CTYPE`.
     * @param library the name of a resource library, from Locale::getResourceLibrary.
     * @param key the English text. The key itself is the result when the library, a catalogue for the
     * language, or the key in it does not exist.
     * @throws std::bad_alloc
     */
    ResourceString(const std::wstring& library, const std::wstring& key);

    /** The text; belongs to this object. */
    const std::wstring& getString() const;

    /** The text; belongs to this object. */
    operator const std::wstring&() const; // NOLINT(google-explicit-constructor,hicpp-explicit-conversions):
                                          // callers assign it to texts

private:
    std::wstring text_;
};

} // namespace TK
