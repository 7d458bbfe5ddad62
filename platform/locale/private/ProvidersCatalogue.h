// The one resource library that there is.
#pragma once

namespace TK::providersCatalogue {

constexpr unsigned long number = 2;
constexpr const wchar_t* library = L"oxahvproviders";
constexpr const char* domain = "oxahvproviders"; // the same name, as gettext takes it

} // namespace TK::providersCatalogue
