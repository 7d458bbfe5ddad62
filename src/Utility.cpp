// Conversion between wide and narrow text by the C library, and without it where ASCII makes the result
// known.
#include "Utility.h"

#include "Trace.h"

#include <algorithm>
#include <array>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <langinfo.h>
#include <type_traits>
#include <utility>

namespace TK {

static const std::string loggerUtility("Hovara.ProviderUtilities");

namespace {

constexpr auto conversionFailed = static_cast<std::size_t>(-1);

// Whether ASCII characters are their own bytes in the thread's encoding, with no state to them.
bool asciiIsPlain() {
    const char* const encoding = ::nl_langinfo(CODESET);
    return std::strcmp(encoding, "UTF-8") == 0 || std::strcmp(encoding, "ANSI_X3.4-1968") == 0;
}

// The number of ASCII characters at the beginning of a text. It looks at blocks without a branch, so that
// compilers look at many characters at once.
template <class Char>
std::size_t asciiSize(const Char* text, std::size_t size) {
    using Code = std::make_unsigned_t<Char>;
    constexpr std::size_t blockSize = 32;
    std::size_t ascii = 0;
    for (; ascii + blockSize <= size; ascii += blockSize) {
        Code all = 0;
        for (std::size_t i = 0; i < blockSize; ++i) {
            all = static_cast<Code>(all | static_cast<Code>(text[ascii + i]));
        }
        if (all >= 0x80) {
            break;
        }
    }
    while (ascii < size && static_cast<Code>(text[ascii]) < 0x80) {
        ++ascii;
    }
    return ascii;
}

// The size of a text's beginning that converts without the C library, which is much slower.
template <class Char>
std::size_t plainSize(const Char* text, std::size_t size) {
    return asciiIsPlain() ? asciiSize(text, size) : 0;
}

// One text, narrow to wide, into one that is empty; what that holds after a failure counts for nothing. A
// wide character takes one byte of input or more, so the input's length always holds the result.
bool convert(const std::string& in, std::wstring& out) {
    const std::size_t length = std::strlen(in.c_str());
    const std::size_t plain = plainSize(in.c_str(), length);
    out.assign(in.c_str(), in.c_str() + plain);
    if (plain == length) {
        return true;
    }
    out.resize(length);
    const std::size_t size = std::mbstowcs(out.data() + plain, in.c_str() + plain, length - plain + 1);
    if (size == conversionFailed) {
        return false;
    }
    out.resize(plain + size);
    return true;
}

// One text, wide to narrow, likewise. The locale decides how many bytes a character takes, so the text goes
// through a block of fixed size: each call continues, in the same shift state, where the one before it had no
// room for a whole character. The state is local, because the one that the C library uses for a null pointer
// belongs to all threads of the process.
bool convert(const std::wstring& in, std::string& out) {
    const std::size_t length = std::wcslen(in.c_str());
    const std::size_t plain = plainSize(in.c_str(), length);
    out.resize(plain);
    std::transform(in.c_str(), in.c_str() + plain, out.begin(),
                   [](wchar_t c) { return static_cast<char>(c); });
    if (plain == length) {
        return true;
    }
    std::array<char, 4096 + MB_LEN_MAX>
        block; // NOLINT(cppcoreguidelines-pro-type-member-init): the C library fills it
    std::mbstate_t state{};
    const wchar_t* rest = in.c_str() + plain;
    while (rest != nullptr) {
        const std::size_t size = std::wcsrtombs(block.data(), &rest, block.size(), &state);
        if (size == conversionFailed) {
            return false;
        }
        out.append(block.data(), size);
    }
    return true;
}

template <class From, class To>
bool convertAll(const std::vector<From>& in, std::vector<To>& out) {
    for (const From& text : in) {
        To converted;
        if (!convert(text, converted)) {
            out.clear();
            return false;
        }
        out.push_back(std::move(converted));
    }
    return true;
}

} // namespace

bool CUtility::WStringToAString(std::wstring in, std::string& out) {
    TK_TRACE_ENTERING(loggerUtility);
    std::string text;
    const bool converted = convert(in, text);
    TK_TRACE_EXITING(loggerUtility);
    if (converted) {
        out.swap(text); // last, since a trace can throw
    }
    return converted;
}

bool CUtility::AStringToWString(std::string in, std::wstring& out) {
    TK_TRACE_ENTERING(loggerUtility);
    std::wstring text;
    const bool converted = convert(in, text);
    TK_TRACE_EXITING(loggerUtility);
    if (converted) {
        out.swap(text); // last, since a trace can throw
    }
    return converted;
}

bool CUtility::AStringArrToWStringArr(std::vector<std::string> in, std::vector<std::wstring>& out) {
    TK_TRACE_ENTERING(loggerUtility);
    const bool converted = convertAll(in, out);
    TK_TRACE_EXITING(loggerUtility);
    return converted;
}

bool CUtility::WStringArrToAStringArr(std::vector<std::wstring> in, std::vector<std::string>& out) {
    TK_TRACE_ENTERING(loggerUtility);
    const bool converted = convertAll(in, out);
    TK_TRACE_EXITING(loggerUtility);
    return converted;
}

} // namespace TK
