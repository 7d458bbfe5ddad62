// Pointers to member functions of a provider's class, kept as those of a base of it.
#pragma once

namespace oxahv::detail {

// GCC for ARM keeps the offset of the base shifted by a bit, and warns of the shift that it makes itself
// where the offset is negative: in every class that has the base second.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wshift-negative-value"
template <class Kept, class Own>
Kept memberOfBase(Own function) {
    return static_cast<Kept>(function);
}
#pragma GCC diagnostic pop

// Calls such a function. GCC's sanitizer takes the adjusted object for the base and reports it.
template <class Base, class Function, class... Arguments>
__attribute__((no_sanitize("vptr"))) void callMember(Base& base, Function function, Arguments&... arguments) {
    (base.*function)(arguments...);
}

} // namespace oxahv::detail
