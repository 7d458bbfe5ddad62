#include "Utility.h"

#include "Trace.h"

#include <array>
#include <climits>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <utility>

namespace TK {

static const std::string loggerUtility("Hovara.ProviderUtilities");

namespace {

constexpr auto conversionFailed = static_cast<std::size_t>(-1);

// One text, narrow to wide, into one that is empty; what that holds after a failure counts for nothing. A
// wide character takes one byte of input or more, so the input's length always holds the result.
bool convert(const std::string& in, std::wstring& out) {
    const std::size_t length = std::strlen(in.c_str());
    out.resize(length);
    const std::size_t size = std::mbstowcs(out.data(), in.c_str(), length + 1);
    if (size == conversionFailed) {
        return false;
    }
    out.resize(size);
    return true;
}

// One text, wide to narrow, likewise. How many bytes a character takes is the locale's affair, so the text
// goes through a block of fixed size: each call goes on, in the same shift state, where the one before it
// found no room for a whole character. The state is our own, because the one behind a null pointer belongs to
// all threads of the process.
bool convert(const std::wstring& in, std::string& out) {
    std::array<char, 4096 + MB_LEN_MAX>
        block; // NOLINT(cppcoreguidelines-pro-type-member-init): the C library fills it
    std::mbstate_t state{};
    const wchar_t* rest = in.c_str();
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
