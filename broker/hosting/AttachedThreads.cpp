#include "hosting/AttachedThreads.h"

#include <algorithm>
#include <vector>

namespace oxahv {

namespace {

class Attachment {
public:
    Attachment(Core& core, std::shared_ptr<AttachedThreads::Record> record);
    ~Attachment();
    Attachment(const Attachment&) = delete;
    Attachment& operator=(const Attachment&) = delete;

    Owner& owner() { return owner_; }

private:
    std::shared_ptr<AttachedThreads::Record> record_;
    Owner owner_;
    Owner::Scope scope_{owner_};
};

// A thread that ends without a detachThread is detached by the end of this list.
thread_local std::vector<std::unique_ptr<Attachment>> attachments;

} // namespace

struct AttachedThreads::Record {
    std::mutex mutex; // held while objects are freed, so that broker and thread never free at the same time
    std::vector<Owner*> owners;
};

namespace {

Attachment::Attachment(Core& core, std::shared_ptr<AttachedThreads::Record> record)
    : record_(std::move(record)), owner_(core) {
    const std::lock_guard<std::mutex> lock(record_->mutex);
    record_->owners.push_back(&owner_);
}

Attachment::~Attachment() {
    const std::lock_guard<std::mutex> lock(record_->mutex);
    owner_.end();
    auto& owners = record_->owners;
    owners.erase(std::remove(owners.begin(), owners.end(), &owner_), owners.end());
}

} // namespace

AttachedThreads::AttachedThreads() : record_(std::make_shared<Record>()) {}

AttachedThreads::~AttachedThreads() {
    const std::lock_guard<std::mutex> lock(record_->mutex);
    for (Owner* const owner : record_->owners) {
        owner->end();
    }
}

void AttachedThreads::attach(Core& core) {
    attachments.push_back(std::make_unique<Attachment>(core, record_));
}

void AttachedThreads::detach(const Core& core) {
    if (attachments.empty() || !attachments.back()->owner().isOf(core)) {
        throw Failure{CMPI_RC_ERR_FAILED};
    }
    attachments.pop_back();
}

} // namespace oxahv
