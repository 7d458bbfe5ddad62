// The memory of objects that have died, kept for a while with a mark in place of each record. A handle that
// is used too late meets the mark in place of something else's memory, and the use is told.
#pragma once

#include "objects/Shards.h"

#include "Testing.h"

#include <array>
#include <atomic>
#include <cstddef>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace oxahv {

class Object;

class Quarantine {
public:
    Quarantine() = default;
    ~Quarantine();
    Quarantine(const Quarantine&) = delete;
    Quarantine& operator=(const Quarantine&) = delete;

    // Ends an object and keeps its memory, until younger ones want the place. The record keeps its function
    // table, through which a caller comes here.
    void bury(Object* object) noexcept;

    // The quarantine of the dead object that a record was; null for any other record, and for a null handle.
    static Quarantine* of(const void* handle);
    // Whether a text is that of a string that has died.
    bool hasText(const char* text) const {
        return text != nullptr && placeOf(text).load(std::memory_order_acquire) == text;
    }

    // Notes a use of what has died.
    void note(std::string_view slot, const void* handle) noexcept;
    std::vector<Misuse> takeMisuses();

private:
    // What a dead object's memory holds, up to its record.
    struct Grave {
        Grave* younger;
        std::size_t size;
        const char* text;   // that was handed out; null if none was
        std::string* chars; // its characters, if they were outside of the object
    };
    struct Yard {
        std::mutex mutex;
        Grave* oldest = nullptr;
        Grave* youngest = nullptr;
        std::size_t count = 0;
        std::size_t bytes = 0;
    };
    static constexpr std::size_t textPlaces = 1024;

    // The only place of a text among those of dead strings; the text that dies last has it.
    std::atomic<const char*>& placeOf(const char* text) const;
    void clear(Grave* grave) noexcept;

    Shards<Yard> yards_;
    mutable std::array<std::atomic<const char*>, textPlaces> texts_{};
    std::mutex misusesMutex_;
    std::vector<Misuse> misuses_;
};

} // namespace oxahv
