#pragma once

#include "platform/base/Error.h"
#include "platform/files/FileDescriptor.h"
#include "platform/processes/ProcessHandle.h"
#include "platform/processes/SharedMemory.h"

#include <chrono>
#include <cstddef>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

namespace qvct {

/// A program of our own that runs beside this process, and no longer than it. Both send bytes to each other,
/// and see one stretch of memory; `ParentProcess` is the other end.
///
/// It is a new program, not a copy of this process, so that locks which other threads hold at that moment
/// cannot block it. It inherits this process's environment, current folder and standard error, and no other
/// file.
class ChildProcess {
  public:
    /// With `memory` bytes to be seen by both. Null, and an error, when it cannot be started. A relative path
    /// is refused: what it stands for depends on where the host happens to be.
    static std::unique_ptr<ChildProcess> start(const std::string& program,
                                               const std::vector<std::string>& arguments, std::size_t memory,
                                               Error* error);
    ChildProcess(const ChildProcess&) = delete;
    ChildProcess& operator=(const ChildProcess&) = delete;
    /// Ends it.
    ~ChildProcess();

    /// Sends as much as the system takes without waiting, and removes that from the beginning of `bytes`.
    void send(std::string& bytes);
    /// Appends what has arrived, without waiting, but not more than a megabyte. False when nothing will
    /// arrive any more.
    bool receive(std::string& bytes);
    void* memory() const { return memory_.address(); }

    /// Tells it that there is nothing more to do. It has a second from then on to end by itself.
    void hangUp();
    void kill();
    /// Hangs up, waits for its end, kills it when it takes too long, and answers how it ended. Takes two
    /// seconds at most: one that cannot even be killed, since the system is busy for it, is left to itself.
    ProcessEnd end();

    struct Awaited {
        const ChildProcess* process;
        bool hasToSend;
    };
    /// Waits until there is something to receive from one of them, or one takes what is to be sent to it; not
    /// longer than `patience`.
    static void await(std::span<const Awaited> processes, std::chrono::milliseconds patience);

  private:
    ChildProcess(int id, FileDescriptor socket, SharedMemory memory)
        : process_(id), socket_(std::move(socket)), memory_(std::move(memory)) {}

    std::optional<ProcessHandle> process_;  ///< None when it has ended.
    FileDescriptor socket_;
    SharedMemory memory_;
    std::chrono::steady_clock::time_point hungUp_;
};

}  // namespace qvct
