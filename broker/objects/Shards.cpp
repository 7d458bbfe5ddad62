#include "objects/Shards.h"

namespace oxahv {

std::size_t shardOfThread() {
    static std::atomic<std::size_t> threads{0};
    thread_local const std::size_t shard = threads.fetch_add(1, std::memory_order_relaxed) % shardCount;
    return shard;
}

void ShardedMutex::lock() {
    for (auto& shard : shards_) {
        shard.part.lock();
    }
}

void ShardedMutex::unlock() {
    for (auto& shard : shards_) {
        shard.part.unlock();
    }
}

} // namespace oxahv
