#include "objects/SharedText.h"

#include "objects/Records.h"

#include <cstring>
#include <limits>
#include <new>

namespace oxahv {

SharedText::SharedText(Core& core, std::string_view text) {
    if (text.size() >= std::numeric_limits<unsigned int>::max()) {
        throw std::bad_alloc();
    }
    void* const memory = ::operator new(sizeof(Block) + text.size() + 1);
    block_ = new (memory) Block{core, {nullptr}, {1}, static_cast<unsigned int>(text.size())};
    auto* const chars = reinterpret_cast<char*>(block_ + 1);
    std::memcpy(chars, text.data(), text.size());
    chars[text.size()] = '\0';
}

SharedText::~SharedText() {
    if (block_->users.fetch_sub(1, std::memory_order_acq_rel) != 1) {
        return;
    }
    if (String* const object = block_->object.load(std::memory_order_relaxed)) {
        bury(object);
    }
    block_->~Block();
    ::operator delete(block_);
}

String& SharedText::object() const {
    String* known = block_->object.load(std::memory_order_acquire);
    if (known == nullptr) {
        auto made = std::make_unique<String>(block_->core, std::string(view()));
        if (block_->object.compare_exchange_strong(known, made.get(), std::memory_order_acq_rel)) {
            known = made.release();
        }
    }
    return *known;
}

} // namespace oxahv
