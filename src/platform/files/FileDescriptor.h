#pragma once

#include <utility>

#include <unistd.h>

namespace qvct {

/// Owns a file descriptor of the system; negative is none.
class FileDescriptor {
  public:
    explicit FileDescriptor(int number) : number_(number) {}
    FileDescriptor(FileDescriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    FileDescriptor(const FileDescriptor&) = delete;
    FileDescriptor& operator=(const FileDescriptor&) = delete;
    FileDescriptor& operator=(FileDescriptor&& other) noexcept {
        std::swap(number_, other.number_);
        return *this;
    }
    ~FileDescriptor() {
        if (number_ >= 0) ::close(number_);
    }
    int number() const { return number_; }
    bool isOpen() const { return number_ >= 0; }
    /// Whether the system accepted all that was written.
    bool close() { return ::close(std::exchange(number_, -1)) == 0; }

  private:
    int number_;
};

}  // namespace qvct
