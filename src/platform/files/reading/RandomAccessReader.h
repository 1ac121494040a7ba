#pragma once

#include "platform/base/Error.h"
#include "platform/files/FileDescriptor.h"
#include "platform/files/replacement/FileReplacement.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// Bytes that can be read at any place: a file, or memory in tests and fuzzers.
class RandomAccessReader {
  public:
    virtual ~RandomAccessReader() = default;
    /// Of the time when it was opened; a file may shrink afterwards.
    virtual std::uint64_t size() const = 0;
    /// Whether all of `into` could be filled with the bytes from `offset` on.
    virtual bool read(std::uint64_t offset, std::span<std::uint8_t> into) const = 0;
};

/// Holds a copy of the bytes, exactly as large as they are.
class MemoryReader : public RandomAccessReader {
  public:
    explicit MemoryReader(std::span<const std::uint8_t> bytes) : bytes_(bytes.begin(), bytes.end()) {}
    std::uint64_t size() const override { return bytes_.size(); }
    bool read(std::uint64_t offset, std::span<std::uint8_t> into) const override;

  private:
    std::vector<std::uint8_t> bytes_;
};

class FileReader : public RandomAccessReader {
  public:
    /// Null, and an error with the path, for anything but a readable regular file.
    static std::shared_ptr<FileReader> open(const std::string& path, Error* error = nullptr);

    std::uint64_t size() const override { return stamp_.size; }
    bool read(std::uint64_t offset, std::span<std::uint8_t> into) const override;
    const FileStamp& stamp() const { return stamp_; }

  private:
    FileReader(FileDescriptor descriptor, const FileStamp& stamp)
        : descriptor_(std::move(descriptor)), stamp_(stamp) {}

    FileDescriptor descriptor_;
    FileStamp stamp_;
};

/// All bytes; nothing, and an error with the name, when they are more than the limit or cannot be read.
std::optional<std::vector<std::uint8_t>> readAll(const RandomAccessReader& reader, std::string_view name,
                                                 std::uint64_t limit, Error* error = nullptr);

}  // namespace qvct
