#include "objects/Object.h"

#include "Core.h"

namespace oxahv {

namespace {

thread_local Owner* currentOwner = nullptr;

} // namespace

Object::Object(Core& core, Kind kind) : core_(core), kind_(kind) {
    core.countObject(kind, 1);
}

Object::~Object() {
    core_.countObject(kind_, -1);
}

Owner::~Owner() {
    end();
}

void bury(Object* object) noexcept {
    object->core().quarantine.bury(object);
}

void Owner::end() {
    Object* object = nullptr;
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        object = std::exchange(newest_, nullptr);
        oldest_ = nullptr;
        lastKept_ = nullptr;
        for (Object* one = object; one != nullptr; one = one->older_) {
            one->owner_ = nullptr;
        }
    }
    buryAll(object);
    core_.store(nullptr, std::memory_order_relaxed);
}

// The object and the older ones in its list.
void Owner::buryAll(Object* object) {
    while (object != nullptr) {
        bury(std::exchange(object, object->older_));
    }
}

void Owner::adopt(std::unique_ptr<Object> object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    Object* const given = object.release();
    given->owner_ = this;
    given->madeAt_ = results();
    given->older_ = newest_;
    (newest_ != nullptr ? newest_->newer_ : oldest_) = given;
    newest_ = given;
}

void Owner::unlink(Object& object) {
    (object.newer_ != nullptr ? object.newer_->older_ : newest_) = object.older_;
    (object.older_ != nullptr ? object.older_->newer_ : oldest_) = object.newer_;
    lastKept_ = lastKept_ == &object ? object.older_ : lastKept_;
    object.owner_ = nullptr;
    object.newer_ = nullptr;
    object.older_ = nullptr;
}

void Owner::release(Object& object) {
    bury(detach(object).release());
}

std::unique_ptr<Object> Owner::detach(Object& object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    unlink(object);
    return std::unique_ptr<Object>(&object);
}

void Owner::freeSince(const Object& mark) {
    Object* doomed = nullptr;
    const std::lock_guard<std::mutex> lock(mutex_);
    for (bool isReached = false; !isReached;) {
        Object* const object = newest_;
        isReached = object == &mark;
        unlink(*object);
        object->older_ = doomed;
        doomed = object;
    }
    buryAll(doomed); // their ends come back to no owner
}

namespace {

// Whether a provider makes such objects for each of its results, and uses them by their handles alone.
bool isOfOneResult(Kind kind) {
    return kind == Kind::instance || kind == Kind::objectPath || kind == Kind::array ||
           kind == Kind::dateTime || kind == Kind::string;
}

} // namespace

void Owner::countResult() {
    constexpr unsigned int window = 1000;
    const std::lock_guard<std::mutex> lock(mutex_);
    if (results_.fetch_add(1, std::memory_order_relaxed) == 0) {
        lastKept_ = newest_;
    }
    Object* object = lastKept_ != nullptr ? lastKept_->newer_ : oldest_;
    while (object != nullptr && results() - object->madeAt_ > window) {
        Object* const next = object->newer_;
        if (isOfOneResult(object->kind()) && !object->isKept()) {
            unlink(*object);
            bury(object);
        } else {
            lastKept_ = object;
        }
        object = next;
    }
}

void Owner::enter() {
    outer_ = currentOwner;
    currentOwner = this;
}

void Owner::leave() {
    for (Owner** link = &currentOwner; *link != nullptr; link = &(*link)->outer_) {
        if (*link == this) {
            *link = outer_;
            return;
        }
    }
}

Owner& Owner::current(Core& core) {
    for (Owner* owner = currentOwner; owner != nullptr; owner = owner->outer_) {
        if (owner->isOf(core)) {
            return *owner;
        }
    }
    return core.owner;
}

} // namespace oxahv
