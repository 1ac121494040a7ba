#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <chrono>
#include <cstdint>
#include <memory>
#include <string>
#include <tuple>

namespace qvct {

/// A turn at editing what lies at a path. All writers of the framework hold one from before they read until
/// they have written; a host that reads an item, decides and writes holds one around all three, so that no
/// tag of another writer is lost.
///
/// It is an advisory lock (`flock`) on the folder that the item lies in, links followed. It leaves no file
/// behind and ends with the process, however that ends. A thread that holds it can take it again at once, and
/// must itself give it back. A process forked meanwhile has no part in it. Where the folder cannot be opened
/// or its file system has no locks, nobody waits; a write then fails if another writer changed the file
/// meanwhile.
class QVCT_API EditLock {
  public:
    /// How long `acquire` waits for its turn.
    static constexpr std::chrono::milliseconds kPatience = std::chrono::seconds(30);

    /// Null when another process still holds the turn after `patience`; the error names that process.
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
