#include "AssetTag.h"

#include "HostTime.h"

#include <ProviderUtilities.h>
#include <utils.h>

#include <algorithm>
#include <ctime>
#include <cwctype>
#include <filesystem>
#include <mutex>
#include <system_error>

using TK::Utils;

namespace {

constexpr const char* tagEntry = "AssetTag";
constexpr const char* dateEntry = "AssetTagDate";
constexpr const char* countEntry = "AssetTagChanges";

bool isBlank(wchar_t c) {
    return std::iswspace(static_cast<std::wint_t>(c)) != 0;
}

} // namespace

bool isAcceptableAssetTag(const std::string& text) {
    constexpr std::size_t longest = 64; // MaxLen of the method's parameter
    std::wstring characters;
    return TK::ProviderUtilities::ConvertMultiByteToWideChar(text, characters) && !characters.empty() &&
           characters.size() <= longest && !isBlank(characters.front()) && !isBlank(characters.back()) &&
           std::none_of(characters.begin(), characters.end(),
                        [](wchar_t c) { return std::iswcntrl(static_cast<std::wint_t>(c)) != 0; }) &&
           TK::ProviderUtilities::ValidateInput(characters, L"");
}

AssetTag AssetTagFile::read() const {
    const std::lock_guard<TK::Mutex> lock(TK::_fileMutex);
    TK::PropertyFile file(path_);
    return {Utils::ReadStringFromFile(file, tagEntry), Utils::ReadDateFromFile(file, dateEntry),
            Utils::ReadUint32FromFile(file, countEntry)};
}

void AssetTagFile::write(const std::string& text) const {
    if (path_.empty()) {
        // A property file without a name would store nothing, and say nothing.
        throw std::system_error(std::make_error_code(std::errc::invalid_argument),
                                "OXAHostStateFile names no file");
    }
    const std::lock_guard<TK::Mutex> lock(TK::_fileMutex);
    const std::filesystem::path folder = std::filesystem::path(path_).parent_path();
    if (!folder.empty()) {
        std::filesystem::create_directories(folder);
    }
    TK::PropertyFile file(path_);
    Utils::WriteStringToFile(file, tagEntry, text);
    Utils::WriteDateToFile(file, dateEntry, localTime(std::time(nullptr)));
    Utils::WriteUint32ToFile(file, countEntry, Utils::ReadUint32FromFile(file, countEntry) + 1);
    file.save();
}
