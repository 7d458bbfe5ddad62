// The threads of providers that are attached to a broker. Each has an owner for what it makes, from its
// attachThread to its detachThread.
#pragma once

#include "objects/Object.h"

#include <memory>

namespace oxahv {

// A thread may stay attached when its broker dies, and end much later. The record of attachments therefore
// belongs to both sides: the broker's end frees what the threads own, and a thread's end then finds nothing.
class AttachedThreads {
public:
    AttachedThreads();
    // Frees what the threads that are still attached have made.
    ~AttachedThreads();
    AttachedThreads(const AttachedThreads&) = delete;
    AttachedThreads& operator=(const AttachedThreads&) = delete;

    // Attaches the calling thread; attachments nest.
    void attach(Core& core);
    // Undoes the calling thread's last attachment. Throws CMPI_RC_ERR_FAILED if that is to another broker.
    static void detach(const Core& core);

    struct Record;

private:
    std::shared_ptr<Record> record_;
};

} // namespace oxahv
