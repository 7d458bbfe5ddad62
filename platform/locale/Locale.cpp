#include "Locale.h"

#include "ProvidersCatalogue.h"

#include <clocale>
#include <langinfo.h>

namespace TK {

std::string Locale::getLanguageId() {
    std::string name = nl_langinfo(_NL_LOCALE_NAME(LC_MESSAGES));
    const std::size_t codeset = name.find('.');
    if (codeset != std::string::npos) {
        name.erase(codeset, name.find('@', codeset) - codeset);
    }
    return name.empty() || name == "C" || name == "POSIX" ? "en" : name;
}

std::wstring Locale::getResourceLibrary(unsigned long number, std::string /*languageId*/) {
    return number == providersCatalogue::number ? providersCatalogue::library : L"";
}

} // namespace TK
