// Where a class's name stands in the class table, found by a hash in place of a search.
//
// The hash takes the name's length and sixteen of its characters. It is made when this is compiled: the first
// seed is taken that gives every class a slot of its own, so that a name has to be compared with one row at
// most.
#pragma once

#include "ClassTable.h"

#include <array>
#include <cstddef>
#include <cstdint>
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

// Eight characters with the bit set that tells lower case from upper: all capitalisations of a name look the
// same. What else looks the same then is told apart when the name is compared. Written as one expression,
// since compilers make one load of that.
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

    // The row that a name can only stand in, if it stands in one at all; classCount when there is none. The
    // length is between shortestClassName and longestClassName.
    constexpr std::size_t rowOf(const char* name, std::size_t length) const {
        return rows_[slotOf(name, length)];
    }

private:
    static constexpr unsigned int slotBits = 11; // of 133 classes, some seed in 75 puts no two in one slot

    // The first character is the same for all, so the block at the beginning leaves it out.
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

    // The search begins where it ends today, since compilers limit how long it may take.
    std::uint64_t seed_ = 0x9E3779B97F4A7E99U;
    std::array<unsigned char, std::size_t{1} << slotBits> rows_{};
};

static_assert(classCount < 255, "a row's number fits a byte");

constexpr ClassIndex classIndex;

} // namespace TK
