#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <tuple>

namespace qvct {

/// A turn at editing what lies at a path. All writers of the framework take one from before they read what
/// they change until it is written; a host that reads an item, decides and writes holds one around all three,
/// and no tag of another writer is lost.
///
/// It is an advisory lock (`flock`) on the folder that the item lies in, links followed. It leaves no file
/// behind and ends with the process, however that ends. A thread that holds it takes it again at once; it is
/// to be given back by the thread that took it. A process that is forked meanwhile has no part in it. Where
/// the folder cannot be opened or its file system has no locks, everybody is let through: then a write over
/// what another writer changed meanwhile is an error.
class QVCT_API EditLock {
  public:
    /// How long a turn is waited for.
    static constexpr std::chrono::milliseconds kPatience = std::chrono::seconds(30);

    /// Null, and an error that names the process whose turn it is then, when it is still another's after
    /// `patience`.
    static std::unique_ptr<EditLock> acquire(const std::string& path, Error* error = nullptr,
                                             std::chrono::milliseconds patience = kPatience);
    EditLock(const EditLock&) = delete;
    EditLock& operator=(const EditLock&) = delete;
    ~EditLock();

  private:
    using Key = std::tuple<std::uint64_t, std::uint64_t, int>;  // the folder's device and number, the process

    explicit EditLock(Key key) : key_(key) {}

    Key key_;
};

}  // namespace qvct
