#include "ResourceString.h"

#include "ProvidersCatalogue.h"
#include "Utf8.h"

#include <dlfcn.h>
#include <filesystem>
#include <libintl.h>
#include <optional>
#include <system_error>

namespace TK {

namespace {

// Where catalogues lie, found from where this library lies, so that an installed copy can be moved.
std::string catalogueFolder() {
    static const char here = 0;
    Dl_info info{};
    if (::dladdr(&here, &info) == 0 || info.dli_fname == nullptr) {
        return {};
    }
    std::error_code error;
    const std::filesystem::path library = std::filesystem::canonical(info.dli_fname, error);
    return error ? std::string() : (library.parent_path() / OXAHV_CATALOGUES).string();
}

// Tells gettext about the catalogue, once in a process.
bool bindCatalogue() {
    const std::string folder = catalogueFolder();
    return !folder.empty() && ::bindtextdomain(providersCatalogue::domain, folder.c_str()) != nullptr &&
           ::bind_textdomain_codeset(providersCatalogue::domain, "UTF-8") != nullptr;
}

// The key as gettext takes it. Gettext knows no NUL, and under the empty key it keeps a catalogue's header.
std::optional<std::string> messageId(const std::wstring& key) {
    std::string id;
    for (const wchar_t character : key) {
        const auto code = static_cast<char32_t>(character);
        if (code == 0 || !encoding::isUnicodeScalar(code)) {
            return std::nullopt;
        }
        encoding::appendUtf8(id, code);
    }
    return id.empty() ? std::nullopt : std::make_optional(std::move(id));
}

std::optional<std::wstring> decode(std::string_view bytes) {
    std::wstring text;
    while (!bytes.empty()) {
        const std::optional<char32_t> code = encoding::takeUtf8(bytes);
        if (!code) {
            return std::nullopt;
        }
        text += static_cast<wchar_t>(*code);
    }
    return text;
}

std::wstring lookUp(const std::wstring& library, const std::wstring& key) {
    if (library != providersCatalogue::library) {
        return key;
    }
    static const bool bound = bindCatalogue();
    const std::optional<std::string> id = messageId(key);
    if (!bound || !id) {
        return key;
    }
    return decode(::dgettext(providersCatalogue::domain, id->c_str())).value_or(key);
}

} // namespace

ResourceString::ResourceString(const std::wstring& library, const std::wstring& key)
    : text_(lookUp(library, key)) {}

const std::wstring& ResourceString::getString() const {
    return text_;
}

ResourceString::operator const std::wstring&() const {
    return text_;
}

} // namespace TK
