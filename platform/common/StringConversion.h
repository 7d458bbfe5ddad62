/**
 * @file
 * Texts of the agent: from wide to narrow, from narrow to wide, and to a stream.
 *
 * **Threads.** Everything here may be called from any thread at any time.
 *
 * **Encoding.** Narrow text is in the multibyte encoding of the calling thread's `LC_CTYPE`, wide text holds
 * one character per `wchar_t`. No text is refused and none is cut short, at a NUL character neither.
 *
 * A byte that is invalid in the encoding, 0x80 to 0xFF, becomes the wide character U+DC80 to U+DCFF, and that
 * one becomes the byte again. No valid text holds these characters, so bytes of another encoding survive the
 * way to wide text and back.
 */
#pragma once

#include "TKExport.h"

#include <ostream>
#include <string>

namespace TK {

/**
 * Converts wide text to narrow text. A character that the encoding lacks becomes a question mark; text in a
 * stateful encoding ends in its initial state.
 * @throws std::bad_alloc
 */
TK_EXPORT std::string make_string(const std::wstring& text);

/**
 * Copies a C text.
 * @param text NUL-terminated; null is the empty text.
 * @throws std::bad_alloc
 */
TK_EXPORT std::string make_string(const char* text);

/**
 * Converts narrow text to wide text. Invalid bytes are kept as said above.
 * @throws std::bad_alloc
 */
TK_EXPORT std::wstring make_wstring(const std::string& text);

/**
 * Writes a text to a stream, with the stream's width and fill, as the standard library does.
 * @return the stream.
 */
TK_EXPORT std::ostream& operator<<(std::ostream& stream, const std::string& text);

} // namespace TK
