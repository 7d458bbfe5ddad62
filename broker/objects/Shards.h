// What many threads change all the time, in parts of which each thread has one to itself as a rule: threads
// that count in the same place, or lock the same lock to read, wait for each other's processor.
#pragma once

#include <array>
#include <atomic>
#include <cstddef>
#include <shared_mutex>

namespace oxahv {

constexpr std::size_t shardCount = 16;

// The calling thread's part.
std::size_t shardOfThread();

// A part, alone in its cache line.
template <class Part>
struct alignas(64) Shard {
    Part part;
};

template <class Part>
using Shards = std::array<Shard<Part>, shardCount>;

// A lock that readers take in their own part, and a writer in all parts.
class ShardedMutex {
public:
    void lock_shared() { shards_[shardOfThread()].part.lock_shared(); }
    void unlock_shared() { shards_[shardOfThread()].part.unlock_shared(); }
    void lock();
    void unlock();

private:
    Shards<std::shared_mutex> shards_;
};

} // namespace oxahv
