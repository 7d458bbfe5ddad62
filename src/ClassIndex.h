// Finds the row of the class table that holds a name, by a hash instead of a search.
//
// The hash uses the name's length and sixteen of its characters. The compiler builds its table: it takes the
// first seed that gives every class a slot of its own, so that a name is compared with at most one row.
#pragma once

#include "ClassTable.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <strings.h>
#include <utility>

namespace TK {

constexpr std::size_t longestClassName = sizeof(ClassEntry::name) - 1;
constexpr std::size_t shortestClassName = 9; // two blocks have to fit

constexpr std::size_t nameLength(const char* name) {
    std::size_t length = 0;
    while (name[length] != '\0') {
        ++length;
    }
    return length;
}

// Eight characters with the case bit set, so that all capitalisations of a name hash alike. Other characters
// that coincide then are found out by the comparison. One expression, because compilers turn it into one
// load.
template <std::size_t... i>
constexpr std::uint64_t foldedBlock(const char* characters, std::index_sequence<i...> /*places*/) {
    return ((std::uint64_t{static_cast<unsigned char>(characters[i])} << (8 * i)) | ...) |
           0x2020202020202020U;
}

constexpr std::uint64_t foldedBlock(const char* characters) {
    return foldedBlock(characters, std::make_index_sequence<8>());
}

class ClassIndex {
public:
    constexpr ClassIndex() {
        while (!fill()) {
            seed_ += 2;
        }
    }

    // The only row that can hold the name; classCount when none can. The length is between shortestClassName
    // and longestClassName.
    constexpr std::size_t rowOf(const char* name, std::size_t length) const {
        return rows_[slotOf(name, length)];
    }

private:
    static constexpr unsigned int slotBits = 11; // with 133 classes, one seed in 75 is free of collisions

    // Every name begins with the same character, so the first block leaves it out.
    constexpr std::size_t slotOf(const char* name, std::size_t length) const {
        const std::uint64_t first = foldedBlock(name + 1) + length;
        const std::uint64_t last = foldedBlock(name + length - 8);
        return static_cast<std::size_t>(((first * seed_) ^ last) * seed_ >> (64 - slotBits));
    }

    constexpr bool fill() {
        for (auto& row : rows_) {
            row = static_cast<unsigned char>(classCount);
        }
        for (std::size_t row = 0; row < classCount; ++row) {
            const char* const name = classTable[row].name;
            unsigned char& slot = rows_[slotOf(name, nameLength(name))];
            if (slot != classCount) {
                return false;
            }
            slot = static_cast<unsigned char>(row);
        }
        return true;
    }

    // The search starts at the seed that it finds today, because compilers limit constant evaluation.
    std::uint64_t seed_ = 0x9E3779B97F4A7E99U;
    std::array<unsigned char, std::size_t{1} << slotBits> rows_{};
};

static_assert(classCount < 255, "a row's number fits a byte");

constexpr ClassIndex classIndex;

// The row with that name, by comparing all of them; classCount when there is none.
inline std::size_t searchRow(const char* name) {
    std::size_t row = 0;
    while (row < classCount && strcasecmp(name, classTable[row].name) != 0) {
        ++row;
    }
    return row;
}

inline bool isAscii(const char* name, std::size_t length) {
    unsigned char bits = 0;
    for (std::size_t i = 0; i < length; ++i) {
        bits |= static_cast<unsigned char>(name[i]);
    }
    return bits < 0x80;
}

// The row with that name, as searchRow finds it. The index folds ASCII only, while strcasecmp folds by the
// locale: in a Turkish one a byte above 0x7F equals an i. So strcasecmp confirms the index's row, and a name
// with such bytes that is not confirmed is searched for.
inline std::size_t findRow(const char* name) {
    const std::size_t length = std::strlen(name);
    if (length < shortestClassName || length > longestClassName) {
        return classCount;
    }
    const std::size_t row = classIndex.rowOf(name, length);
    if (row != classCount && strcasecmp(name, classTable[row].name) == 0) {
        return row;
    }
    return isAscii(name, length) ? classCount : searchRow(name);
}

} // namespace TK
