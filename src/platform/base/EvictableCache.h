#pragma once

#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <unordered_map>

namespace qvct {

/// Shared objects by key, which may be dropped at any time and are then made again by whoever asks.
///
/// Safe from every thread. Dropping an entry does not touch what callers still hold.
template <typename T>
class EvictableCache {
  public:
    std::shared_ptr<T> objectForKey(const std::string& key) const {
        const std::lock_guard lock(mutex_);
        const auto hit = objects_.find(key);
        return hit == objects_.end() ? nullptr : hit->second;
    }

    /// Keeps the object unless another thread was first; the one that is kept.
    std::shared_ptr<T> addObject(const std::string& key, std::shared_ptr<T> object) {
        const std::lock_guard lock(mutex_);
        return objects_.try_emplace(key, std::move(object)).first->second;
    }

    /// Drops everything, as a host does when memory runs short.
    void removeAllObjects() {
        const std::lock_guard lock(mutex_);
        objects_.clear();
    }

  private:
    mutable std::mutex mutex_;
    std::unordered_map<std::string, std::shared_ptr<T>> objects_;
};

}  // namespace qvct
