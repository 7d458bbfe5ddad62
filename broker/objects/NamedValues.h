// Values by name, in the order in which the names came: keys, properties, arguments, context entries.
#pragma once

#include "objects/Value.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

// A list of names, each once, that finds them in any case.
class Names {
public:
    static constexpr std::size_t none = static_cast<std::size_t>(-1);

    Names() = default;
    Names(const Names&) = delete;
    Names& operator=(const Names&) = delete;
    ~Names() = default;

    std::size_t size() const { return list_.size(); }
    const std::string& operator[](std::size_t index) const { return list_[index]; }
    // The position of a name, `none` when it is not there.
    std::size_t find(std::string_view name) const;
    // Adds a name that is not there.
    void add(std::string_view name);

private:
    std::vector<std::string> list_;
    std::map<std::string, std::size_t, encoding::NameLess> index_; // of long lists
};

struct NamedValue {
    const std::string& name;
    const Value& value;
};

// Copies share names and values until one of them is changed, unless a value can be changed through a handle.
class NamedValues {
public:
    NamedValues() = default;
    // NULL values by the first names of a list, which must outlive them and their copies.
    NamedValues(const Names& names, std::vector<Value> values);
    NamedValues(const NamedValues& other);
    NamedValues(NamedValues&& other) noexcept : content_(std::exchange(other.content_, nullptr)) {}
    NamedValues& operator=(NamedValues other) noexcept {
        std::swap(content_, other.content_);
        return *this;
    }
    ~NamedValues();

    std::optional<NamedValue> find(std::string_view name) const;
    void set(std::string_view name, Value value);
    std::size_t size() const;
    // Throws CMPI_RC_ERR_NOT_FOUND for an index out of range.
    NamedValue at(std::size_t index) const;
    // Removes the others. `isKept` takes a name.
    template <class Predicate>
    void keepOnly(const Predicate& isKept) {
        rebuild([&](NamedValues& kept, const NamedValue& named) {
            if (isKept(named.name)) {
                kept.set(named.name, named.value);
            }
        });
    }
    // Makes the list anew: `add` takes the new list and one value of the old one after the other.
    template <class Add>
    void rebuild(const Add& add) {
        NamedValues changed;
        for (const NamedValue& named : *this) {
            add(changed, named);
        }
        *this = std::move(changed);
    }

    // Puts the last one first.
    void reverse();

    class Iterator {
    public:
        using iterator_category = std::input_iterator_tag;
        using value_type = NamedValue;
        using difference_type = std::ptrdiff_t;
        using pointer = void;
        using reference = NamedValue;

        Iterator(const NamedValues& values, std::size_t index) : values_(values), index_(index) {}
        NamedValue operator*() const { return values_.at(index_); }
        Iterator& operator++() {
            ++index_;
            return *this;
        }
        Iterator operator++(int) { return {values_, index_++}; }
        bool operator==(const Iterator& other) const { return index_ == other.index_; }
        bool operator!=(const Iterator& other) const { return index_ != other.index_; }

    private:
        const NamedValues& values_;
        std::size_t index_;
    };
    Iterator begin() const { return {*this, 0}; }
    Iterator end() const { return {*this, size()}; }

private:
    struct Content;

    Content& own();

    Content* content_ = nullptr; // null for an empty list
};

} // namespace oxahv
