// The text of a value: immutable, and one for all copies of the value. It becomes a CMPIString when a slot
// hands it out and not before, since most texts of a reply are never asked for as an object.
#pragma once

#include "objects/Object.h"

#include <atomic>
#include <string_view>

namespace oxahv {

class String;

class SharedText {
public:
    SharedText(Core& core, std::string_view text);
    SharedText(const SharedText& other) : block_(other.block_) {
        block_->users.fetch_add(1, std::memory_order_relaxed);
    }
    SharedText& operator=(const SharedText&) = delete;
    ~SharedText();

    const char* chars() const { return reinterpret_cast<const char*>(block_ + 1); }
    std::string_view view() const { return {chars(), block_->size}; }
    // The text as an object, which is a part of it. Threads may ask for it at the same time.
    String& object() const;

private:
    struct Block { // the characters follow, with a null at their end
        Core& core;
        std::atomic<String*> object;
        std::atomic<unsigned int> users;
        unsigned int size;
    };

    Block* block_;
};

} // namespace oxahv
