#include "Moniker.h"

#include <array>
#include <charconv>
#include <limits>
#include <locale>
#include <sstream>
#include <utility>

namespace TK {

namespace {

const char* const notSelected = "Key is not selected.";
const char* const notReadable =
    "Either the Key is not selected or the value is not compatible with the requested data type.";

// Whether streams write and read plain digits; then std::to_chars and std::from_chars do the same at a
// fraction of the cost. Any other global locale may group digits and know other white space.
bool digitsArePlain() {
    return std::locale() == std::locale::classic();
}

// The text of a number as a default stream of the global locale writes it, which is the same for every
// unsigned type. The stream would swallow a failed allocation and hand out a short text; with badbit raising
// exceptions it passes std::bad_alloc on instead.
std::string textOf(unsigned long long number) {
    if (digitsArePlain()) {
        std::array<char, std::numeric_limits<unsigned long long>::digits10 + 1>
            digits; // NOLINT(*-member-init): written next
        return {digits.data(), std::to_chars(digits.data(), digits.data() + digits.size(), number).ptr};
    }
    std::ostringstream stream;
    stream.exceptions(std::ios_base::badbit);
    stream << number;
    return stream.str();
}

// A stream writes a character as the byte itself, not as a number.
std::string textOfByte(unsigned char byte) {
    return {static_cast<char>(byte)};
}

// Reads a number or character as a default stream of the global locale reads it.
template <class Value>
void extract(const std::string& text, Value& value) {
    std::istringstream stream(text);
    stream.exceptions(std::ios_base::badbit);
    stream >> value;
}

// Reads what textOf wrote. No locale reads a larger number from it, so every type is read as the widest.
template <class Number>
void numberOf(const std::string& text, Number& number) {
    unsigned long long widest = number;
    if (digitsArePlain()) {
        std::from_chars(text.data(), text.data() + text.size(), widest);
    } else {
        extract(text, widest);
    }
    number = static_cast<Number>(widest);
}

// A stream skips white space, finds nothing after it, and leaves `byte` as it is.
void numberOf(const std::string& text, unsigned char& byte) {
    if (!digitsArePlain()) {
        extract(text, byte);
    } else if (text[0] != ' ' && (text[0] < '\t' || text[0] > '\r')) {
        byte = static_cast<unsigned char>(text[0]);
    }
}

} // namespace

FrameworkException::FrameworkException(const char* text) : message(text != nullptr ? text : "") {}
FrameworkException::FrameworkException(const FrameworkException& other) = default;
FrameworkException& FrameworkException::operator=(const FrameworkException& other) = default;
FrameworkException::~FrameworkException() noexcept = default;

const char* FrameworkException::what() const noexcept {
    return message.c_str();
}

Moniker::Moniker() = default;
Moniker::Moniker(const Moniker& other) = default;
// NOLINTNEXTLINE(cert-oop54-cpp,bugprone-unhandled-self-assignment): a moniker may be assigned to itself
Moniker& Moniker::operator=(const Moniker& other) {
    // The list is copied first: when memory runs out, the selection must still belong to the old list.
    std::vector<KeyComponent> copy(other.keys);
    keys.swap(copy);
    keySelected = other.keySelected;
    selectedKey = other.selectedKey;
    return *this;
}
Moniker::~Moniker() = default;

unsigned int Moniker::getKeyCount() const {
    return static_cast<unsigned int>(keys.size());
}

bool Moniker::selectKey(unsigned int index) {
    keySelected = index < keys.size();
    if (keySelected) {
        selectedKey = index;
    }
    return keySelected;
}

void Moniker::getType(unsigned short& type) const {
    type = static_cast<unsigned short>(selected(notSelected).type);
}

void Moniker::getName(std::string& name) const {
    name = selected(notSelected).name;
}

void Moniker::getValue(std::string& value) const {
    value = selected(COMPONENT_STRING).value;
}

void Moniker::getValue(unsigned char& value) const {
    numberOf(selected(COMPONENT_UINT8).value, value);
}

void Moniker::getValue(unsigned short& value) const {
    numberOf(selected(COMPONENT_UINT16).value, value);
}

void Moniker::getValue(unsigned int& value) const {
    numberOf(selected(COMPONENT_UINT32).value, value);
}

void Moniker::getValue(unsigned long long& value) const {
    numberOf(selected(COMPONENT_UINT64).value, value);
}

unsigned short Moniker::addKey(std::string name, const std::string& value) {
    return append(COMPONENT_STRING, std::move(name), std::string(value));
}

unsigned short Moniker::addKey(std::string name, unsigned char value) {
    return append(COMPONENT_UINT8, std::move(name), textOfByte(value));
}

unsigned short Moniker::addKey(std::string name, unsigned short value) {
    return append(COMPONENT_UINT16, std::move(name), textOf(value));
}

unsigned short Moniker::addKey(std::string name, unsigned int value) {
    return append(COMPONENT_UINT32, std::move(name), textOf(value));
}

unsigned short Moniker::addKey(std::string name, unsigned long long value) {
    return append(COMPONENT_UINT64, std::move(name), textOf(value));
}

const Moniker::KeyComponent& Moniker::selected(const char* complaint) const {
    if (!keySelected) {
        throw FrameworkException(complaint);
    }
    return keys[selectedKey];
}

const Moniker::KeyComponent& Moniker::selected(ComponentType type) const {
    const KeyComponent& component = selected(notReadable);
    if (component.type != type) {
        throw FrameworkException(notReadable);
    }
    return component;
}

unsigned short Moniker::append(ComponentType type, std::string&& name, std::string&& value) {
    KeyComponent& component = keys.emplace_back(); // may throw; what follows does not
    component.type = type;
    component.name = std::move(name);
    component.value = std::move(value);
    const auto position = static_cast<unsigned short>(keys.size() - 1);
    keySelected = true;
    selectedKey = position;
    return position;
}

} // namespace TK
