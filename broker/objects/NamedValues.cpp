#include "objects/NamedValues.h"

#include <atomic>
#include <memory>

namespace oxahv {

namespace {

// Shorter lists are looked through faster than an index finds.
constexpr std::size_t mostWithoutIndex = 24;

// Names of one class often begin alike: the last letter parts most of them.
bool endsAlike(std::string_view a, std::string_view b) {
    return a.size() == b.size() &&
           (a.empty() || encoding::foldedLetter(a.back()) == encoding::foldedLetter(b.back()));
}

} // namespace

std::size_t Names::find(std::string_view name) const {
    if (!index_.empty()) {
        const auto found = index_.find(name);
        return found != index_.end() ? found->second : none;
    }
    const auto found = std::find_if(list_.begin(), list_.end(), [&](const std::string& one) {
        return endsAlike(one, name) && (one == name || sameName(one, name));
    });
    return found != list_.end() ? static_cast<std::size_t>(found - list_.begin()) : none;
}

void Names::add(std::string_view name) {
    list_.emplace_back(name);
    if (list_.size() <= mostWithoutIndex) {
        return;
    }
    for (std::size_t i = index_.size(); i < list_.size(); ++i) {
        index_.emplace(list_[i], i);
    }
}

// The values, and their names: those of a declared class, or own ones.
struct NamedValues::Content {
    std::atomic<unsigned int> users{1};
    const Names* declared = nullptr;
    std::unique_ptr<Names> own;
    std::vector<Value> values;

    const Names& names() const { return own != nullptr ? *own : *declared; }
    void add(std::string_view name, Value value) {
        if (own == nullptr) {
            own = copyOfNames();
        }
        values.push_back(std::move(value));
        own->add(name);
    }
    std::unique_ptr<Names> copyOfNames() const {
        auto copy = std::make_unique<Names>();
        for (std::size_t i = 0; i < values.size(); ++i) {
            copy->add(names()[i]);
        }
        return copy;
    }
    std::unique_ptr<Content> copy() const {
        auto copy = std::make_unique<Content>();
        copy->declared = declared;
        copy->own = own != nullptr ? copyOfNames() : nullptr;
        copy->values = values;
        return copy;
    }
};

NamedValues::NamedValues(const Names& names, std::vector<Value> values) : content_(new Content) {
    content_->declared = &names;
    content_->values = std::move(values);
}

NamedValues::NamedValues(const NamedValues& other) : content_(other.content_) {
    if (content_ == nullptr) {
        return;
    }
    const std::vector<Value>& values = content_->values;
    if (std::any_of(values.begin(), values.end(), [](const Value& value) { return value.holdsObject(); })) {
        content_ = content_->copy().release();
    } else {
        content_->users.fetch_add(1, std::memory_order_relaxed);
    }
}

NamedValues::~NamedValues() {
    if (content_ != nullptr && content_->users.fetch_sub(1, std::memory_order_acq_rel) == 1) {
        delete content_;
    }
}

// The content, to be changed: others that share it keep it as it is.
NamedValues::Content& NamedValues::own() {
    if (content_ == nullptr) {
        content_ = new Content;
        content_->own = std::make_unique<Names>();
    } else if (content_->users.load(std::memory_order_acquire) != 1) {
        NamedValues changed;
        changed.content_ = content_->copy().release();
        *this = std::move(changed);
    }
    return *content_;
}

std::optional<NamedValue> NamedValues::find(std::string_view name) const {
    const std::size_t index = content_ != nullptr ? content_->names().find(name) : Names::none;
    if (index >= size()) {
        return std::nullopt;
    }
    return at(index);
}

void NamedValues::set(std::string_view name, Value value) {
    Content& content = own();
    const std::size_t index = content.names().find(name);
    if (index < content.values.size()) {
        content.values[index] = std::move(value);
    } else {
        content.add(name, std::move(value));
    }
}

void NamedValues::reverse() {
    NamedValues changed;
    for (std::size_t i = size(); i > 0; --i) {
        changed.set(at(i - 1).name, at(i - 1).value);
    }
    *this = std::move(changed);
}

std::size_t NamedValues::size() const {
    return content_ != nullptr ? content_->values.size() : 0;
}

NamedValue NamedValues::at(std::size_t index) const {
    if (index >= size()) {
        throw Failure{CMPI_RC_ERR_NOT_FOUND};
    }
    return {content_->names()[index], content_->values[index]};
}

} // namespace oxahv
