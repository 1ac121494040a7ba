#include "platform/processes/SharedMemory.h"

#include <sys/mman.h>
#include <sys/stat.h>

namespace qvct {

void SharedMemory::Unmapping::operator()(void* address) const {
    ::munmap(address, size);
}

std::optional<SharedMemory> SharedMemory::make(std::size_t size) {
    FileDescriptor descriptor(::memfd_create("qvct", MFD_CLOEXEC));
    if (!descriptor.isOpen() || ::ftruncate(descriptor.number(), static_cast<off_t>(size)) != 0)
        return std::nullopt;
    return open(std::move(descriptor), size);
}

std::optional<SharedMemory> SharedMemory::open(FileDescriptor descriptor, std::size_t size) {
    struct stat status {};
    // Bytes behind the end of a file can be mapped, but touching them ends the process.
    if (::fstat(descriptor.number(), &status) != 0 || static_cast<std::size_t>(status.st_size) < size)
        return std::nullopt;
    void* address = ::mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor.number(), 0);
    if (address == MAP_FAILED) return std::nullopt;
    return SharedMemory(std::move(descriptor), address, size);
}

}  // namespace qvct
