#include "objects/Quarantine.h"

#include "objects/Records.h"

#include <cstdint>
#include <cstring>
#include <memory>
#include <new>

namespace oxahv {

namespace {

// Of each yard.
constexpr std::size_t mostObjects = 4096;
constexpr std::size_t mostBytes = 1024UL * 1024;
constexpr std::size_t mostMisuses = 1000;

// The beginning of every record. A live one leads to its object; the odd address in a dead one leads to the
// quarantine.
struct RecordHead {
    void* object;
    const void* table;
};

RecordHead headOf(const void* handle) {
    RecordHead head{};
    std::memcpy(&head, handle, sizeof head); // records are types of their own: see objectOf
    return head;
}

// The characters of a string that have been handed out, where the string keeps them outside of itself: they
// have to outlive it.
std::string* takeChars(String& string) {
    const char* const chars = string.text.data();
    const char* const begin = reinterpret_cast<const char*>(&string);
    const bool isInside = chars >= begin && chars < begin + sizeof string;
    return isInside ? nullptr : new std::string(std::move(string.text));
}

} // namespace

Quarantine::~Quarantine() {
    for (auto& shard : yards_) {
        while (Grave* const grave = shard.part.oldest) {
            shard.part.oldest = grave->younger;
            clear(grave);
        }
    }
}

std::atomic<const char*>& Quarantine::placeOf(const char* text) const {
    const auto address = reinterpret_cast<std::uintptr_t>(text);
    return texts_[(address / 16 ^ address / 16384) % textPlaces];
}

void Quarantine::clear(Grave* grave) noexcept {
    if (grave->text != nullptr) {
        const char* text = grave->text;
        placeOf(text).compare_exchange_strong(text, nullptr, std::memory_order_acq_rel);
    }
    delete grave->chars;
    ::operator delete(grave);
}

void Quarantine::bury(Object* object) noexcept {
    static_assert(sizeof(Grave) <= sizeof(Object), "the record follows the object");
    void* const record = object->record();
    RecordHead head = headOf(record);
    Grave grave = {nullptr, object->size(), nullptr, nullptr};
    if (auto* const string = object->kind() == Kind::string ? static_cast<String*>(object) : nullptr;
        string != nullptr && string->isKept()) {
        grave.text = string->text.data();
        try {
            grave.chars = takeChars(*string);
        } catch (const std::bad_alloc&) { // the text is lost to sight
            grave.text = nullptr;
        }
    }
    object->~Object();
    head.object = reinterpret_cast<char*>(this) + 1;
    std::memcpy(record, &head, sizeof head);
    auto* const buried = new (static_cast<void*>(object)) Grave(grave);
    if (grave.text != nullptr) {
        grave.size += grave.chars != nullptr ? grave.chars->capacity() : 0;
        buried->size = grave.size;
        placeOf(grave.text).store(grave.text, std::memory_order_release);
    }
    Yard& yard = yards_[shardOfThread()].part;
    Grave* gone = nullptr; // oldest first, up to the oldest that stays
    const Grave* stays = nullptr;
    {
        const std::lock_guard<std::mutex> lock(yard.mutex);
        (yard.youngest != nullptr ? yard.youngest->younger : yard.oldest) = buried;
        yard.youngest = buried;
        ++yard.count;
        yard.bytes += buried->size;
        gone = yard.oldest;
        while (yard.count > mostObjects || yard.bytes > mostBytes) {
            --yard.count;
            yard.bytes -= yard.oldest->size;
            yard.oldest = yard.oldest->younger;
        }
        yard.youngest = yard.oldest != nullptr ? yard.youngest : nullptr;
        stays = yard.oldest;
    }
    while (gone != stays) {
        clear(std::exchange(gone, gone->younger));
    }
}

Quarantine* Quarantine::of(const void* handle) {
    if (handle == nullptr || !isRecord(handle)) {
        return nullptr;
    }
    auto* const mark = static_cast<char*>(headOf(handle).object);
    const bool isMark = reinterpret_cast<std::uintptr_t>(mark) % 2 != 0;
    return isMark ? reinterpret_cast<Quarantine*>(mark - 1) : nullptr;
}

void Quarantine::note(std::string_view slot, const void* handle) noexcept {
    try {
        const std::lock_guard<std::mutex> lock(misusesMutex_);
        if (misuses_.size() < mostMisuses) {
            misuses_.push_back({std::string(slot), handle, std::this_thread::get_id()});
        }
    } catch (const std::bad_alloc&) { // NOLINT(bugprone-empty-catch): the caller learns by the code
    }
}

std::vector<Misuse> Quarantine::takeMisuses() {
    const std::lock_guard<std::mutex> lock(misusesMutex_);
    return std::exchange(misuses_, {});
}

} // namespace oxahv
