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

void Owner::end() {
    while (newest_ != nullptr) {
        release(*newest_);
    }
    core_.store(nullptr, std::memory_order_relaxed);
}

void Owner::adopt(std::unique_ptr<Object> object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    Object* const given = object.release();
    given->owner_ = this;
    given->older_ = newest_;
    if (newest_ != nullptr) {
        newest_->newer_ = given;
    }
    newest_ = given;
}

void Owner::unlink(Object& object) {
    (object.newer_ != nullptr ? object.newer_->older_ : newest_) = object.older_;
    if (object.older_ != nullptr) {
        object.older_->newer_ = object.newer_;
    }
    object.owner_ = nullptr;
    object.newer_ = nullptr;
    object.older_ = nullptr;
}

std::unique_ptr<Object> Owner::release(Object& object) {
    const std::lock_guard<std::mutex> lock(mutex_);
    unlink(object);
    return std::unique_ptr<Object>(&object);
}

void Owner::freeSince(const Object& mark) {
    Owner doomed(*core_); // frees outside the lock
    const std::lock_guard<std::mutex> lock(mutex_);
    for (bool reached = false; !reached && newest_ != nullptr;) {
        Object& object = *newest_;
        reached = &object == &mark;
        unlink(object);
        doomed.adopt(std::unique_ptr<Object>(&object));
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
