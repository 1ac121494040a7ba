#pragma once

#include "platform/files/FileDescriptor.h"

#include <cstddef>
#include <memory>
#include <optional>

namespace qvct {

/// Memory that several processes see. It lives as long as one of them does.
class SharedMemory {
  public:
    /// Makes memory that is filled with zeros, and answers the descriptor by which other processes see it,
    /// too. None of them can change its size. Not open, and `errno` says why, where the system has no more.
    static FileDescriptor make(std::size_t size);
    /// What was made here or in another process; the descriptor is not needed any more afterwards. Nothing
    /// when it stands for something else.
    static std::optional<SharedMemory> map(const FileDescriptor& descriptor, std::size_t size);

    void* address() const { return address_.get(); }

  private:
    struct Unmapping {
        std::size_t size;
        void operator()(void* address) const;
    };

    SharedMemory(void* address, std::size_t size) : address_(address, Unmapping{size}) {}

    std::unique_ptr<void, Unmapping> address_;
};

}  // namespace qvct
