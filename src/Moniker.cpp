#include "Moniker.h"

#include <sstream>
#include <utility>

namespace TK {

namespace {

const char* const notSelected = "Key is not selected.";
const char* const notReadable =
    "Either the Key is not selected or the value is not compatible with the requested data type.";

// The text of a number as a default stream of the global locale writes it. The stream would swallow a failed
// allocation and hand out a short text; with badbit raising exceptions it passes std::bad_alloc on instead.
template <class Number>
std::string textOf(Number number) {
    std::ostringstream stream;
    stream.exceptions(std::ios_base::badbit);
    stream << number;
    return stream.str();
}

// Reads what textOf wrote. A text that holds nothing to read leaves `number` as it is.
template <class Number>
void numberOf(const std::string& text, Number& number) {
    std::istringstream stream(text);
    stream.exceptions(std::ios_base::badbit);
    stream >> number;
}

} // namespace

FrameworkException::FrameworkException(const char* text) : message(text != nullptr ? text : "") {}
FrameworkException::FrameworkException(const FrameworkException& other) = default;
FrameworkException& FrameworkException::operator=(const FrameworkException& other) = default;
FrameworkException::~FrameworkException() noexcept = default;

const char* FrameworkException::what() const noexcept {
    return message.c_str();
}

Moniker::Moniker() : keySelected(false), selectedKey(0) {}
Moniker::Moniker(const Moniker& other) = default;
Moniker& Moniker::operator=(const Moniker& other) {
    // The list is copied first: when memory runs out, the selection must not be one of a list that never
    // came.
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
    return append(COMPONENT_UINT8, std::move(name), textOf(value));
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
    keys.push_back({type, std::move(name), std::move(value)});
    const auto position = static_cast<unsigned short>(keys.size() - 1);
    keySelected = true;
    selectedKey = position;
    return position;
}

} // namespace TK
