// A fixed number of threads that work on what is waiting.
#pragma once

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

namespace oxahv::runner {

class Workers {
public:
    Workers(unsigned int threads, std::size_t mostWaiting);
    // As finish().
    ~Workers();
    Workers(const Workers&) = delete;
    Workers& operator=(const Workers&) = delete;

    // Has a thread do it when one is free. Returns false, and does nothing, when too much is waiting already.
    // The task must not throw.
    bool add(std::function<void()> task);
    // Waits until all tasks are done, and ends the threads.
    void finish();

private:
    void work();

    const std::size_t mostWaiting_;
    std::mutex mutex_;
    std::condition_variable changed_;
    std::deque<std::function<void()>> waiting_;
    bool isEnding_ = false;
    std::vector<std::thread> threads_;
};

} // namespace oxahv::runner
