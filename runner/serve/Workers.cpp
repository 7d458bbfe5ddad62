#include "serve/Workers.h"

namespace oxahv::runner {

Workers::Workers(unsigned int threads, std::size_t mostWaiting) : mostWaiting_(mostWaiting) {
    try {
        for (unsigned int i = 0; i < threads; ++i) {
            threads_.emplace_back([this] { work(); });
        }
    } catch (...) { // the system has no more threads
        finish();
        throw;
    }
}

Workers::~Workers() {
    finish();
}

bool Workers::add(std::function<void()> task) {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (waiting_.size() >= mostWaiting_ || isEnding_) {
        return false;
    }
    waiting_.push_back(std::move(task));
    changed_.notify_one();
    return true;
}

void Workers::finish() {
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        isEnding_ = true;
        changed_.notify_all();
    }
    for (std::thread& thread : threads_) {
        thread.join();
    }
    threads_.clear();
}

void Workers::work() {
    std::unique_lock<std::mutex> lock(mutex_);
    for (;;) {
        changed_.wait(lock, [this] { return isEnding_ || !waiting_.empty(); });
        if (waiting_.empty()) {
            return;
        }
        const std::function<void()> task = std::move(waiting_.front());
        waiting_.pop_front();
        lock.unlock();
        task();
        lock.lock();
    }
}

} // namespace oxahv::runner
