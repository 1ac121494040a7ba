#include "platform/processes/SharedMemory.h"

#include <utility>

#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>

namespace qvct {

void SharedMemory::Unmapping::operator()(void* address) const {
    ::munmap(address, size);
}

FileDescriptor SharedMemory::make(std::size_t size) {
    FileDescriptor memory(::memfd_create("qvct", MFD_CLOEXEC | MFD_ALLOW_SEALING));
    // Bytes behind the end of a file can be mapped, but touching them ends the process: no other process may
    // move the end.
    constexpr int seals = F_SEAL_SHRINK | F_SEAL_GROW | F_SEAL_SEAL;
    const bool isMade = memory.isOpen() && ::ftruncate(memory.number(), static_cast<off_t>(size)) == 0 &&
                        ::fcntl(memory.number(), F_ADD_SEALS, seals) == 0;
    return isMade ? std::move(memory) : FileDescriptor(-1);
}

std::optional<SharedMemory> SharedMemory::map(const FileDescriptor& descriptor, std::size_t size) {
    struct stat status {};
    if (::fstat(descriptor.number(), &status) != 0 || static_cast<std::size_t>(status.st_size) < size)
        return std::nullopt;
    void* address = ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor.number(), 0);
    if (address == MAP_FAILED) return std::nullopt;
    return SharedMemory(address, size);
}

}  // namespace qvct
