#pragma once

#include "platform/files/FileDescriptor.h"

#include <cstddef>
#include <memory>
#include <optional>

namespace qvct {

/// Memory that is shared by all processes that have its descriptor. Filled with zeros when it is made.
class SharedMemory {
  public:
    /// Nothing where the system has no more.
    static std::optional<SharedMemory> make(std::size_t size);
    /// What another process has made; nothing when the descriptor stands for something else.
    static std::optional<SharedMemory> open(FileDescriptor descriptor, std::size_t size);

    int descriptor() const { return descriptor_.number(); }
    void* address() const { return address_.get(); }

  private:
    struct Unmapping {
        std::size_t size;
        void operator()(void* address) const;
    };

    SharedMemory(FileDescriptor descriptor, void* address, std::size_t size)
        : descriptor_(std::move(descriptor)), address_(address, Unmapping{size}) {}

    FileDescriptor descriptor_;
    std::unique_ptr<void, Unmapping> address_;
};

}  // namespace qvct
