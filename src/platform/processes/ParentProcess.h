#pragma once

#include "platform/files/FileDescriptor.h"
#include "platform/processes/SharedMemory.h"

#include <cstddef>
#include <optional>
#include <string>

namespace qvct {

/// The other end of a `ChildProcess`, in a program that was started as one. The process ends with its parent.
class ParentProcess {
  public:
    /// To be called first in such a program, which cannot use standard input and output from then on. Nothing
    /// when the process was not started as a `ChildProcess` with that much memory, or its parent is gone.
    static std::optional<ParentProcess> connect(std::size_t memory);

    /// Waits until all was sent, and empties `bytes`. False when nobody receives any more.
    bool send(std::string& bytes);
    /// Waits for something, and appends it. False when nothing will arrive any more.
    bool receive(std::string& bytes);
    /// Whether there is something to receive.
    bool hasInput() const;
    void* memory() const { return memory_.address(); }

  private:
    ParentProcess(FileDescriptor socket, SharedMemory memory)
        : socket_(std::move(socket)), memory_(std::move(memory)) {}

    FileDescriptor socket_;
    SharedMemory memory_;
};

}  // namespace qvct
