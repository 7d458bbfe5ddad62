/**
 * @file
 * TK::CUtility, conversion between wide and narrow text.
 *
 * Narrow text is the multibyte encoding of the character-type locale (`LC_CTYPE`) that is in force on the
 * calling thread: the one that the program set with `setlocale`, or the thread with `uselocale`. The library
 * sets none. A program that never did either is in the "C" locale, where only ASCII converts. Wide text holds
 * one `wchar_t` per character.
 *
 * **Threads.** Every operation may run on any number of threads at once. None takes a lock or keeps a state;
 * conversions do not share one with each other or with the program.
 *
 * **Ownership.** Inputs are taken by value, outputs belong to the caller.
 *
 * **Traces.** Each operation emits an ENTERING and an EXITING trace under the category
 * "Hovara.ProviderUtilities".
 *
 * **Failures.** The result says whether the locale could convert everything. `std::bad_alloc` passes through,
 * and so does what a trace's logger throws.
 */
#pragma once

#include "TKExport.h"

#include <string>
#include <vector>

namespace TK {

/** A family of static operations. The top of Utility.h says what holds for all of them. */
class TK_EXPORT CUtility {
public:
    CUtility() = delete;

    /** @name One text
     * @param in the text; what follows its first NUL character is dropped.
     * @param[out] out replaced by the converted text; as it was when false is returned or anything is thrown.
     * @return false when the locale cannot represent a character, or a byte sequence is invalid in it.
     * @{ */
    /** Wide to narrow, whole in every encoding, stateful ones included. */
    static bool WStringToAString(std::wstring in, std::string& out);
    static bool AStringToWString(std::string in, std::wstring& out); ///< Narrow to wide.
    ///@}

    /** @name Many texts
     * @param in the texts; of each, what follows its first NUL character is dropped.
     * @param[in,out] out the converted texts are appended in order; **emptied** when one cannot be converted,
     * what it held before included.
     * @return false when one of them cannot be converted; those behind it are not looked at.
     * @throws std::bad_alloc the texts converted before it stay in `out`
     * @{ */
    static bool AStringArrToWStringArr(std::vector<std::string> in,
                                       std::vector<std::wstring>& out); ///< Each narrow to wide.
    static bool WStringArrToAStringArr(std::vector<std::wstring> in,
                                       std::vector<std::string>& out); ///< Each wide to narrow.
    ///@}
};

} // namespace TK
