#pragma once

#include "platform/base/Error.h"

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct stat;

namespace qvct {

class FileDescriptor;

/// Largest file that is read whole into memory: property lists, scripts, tables, presets.
inline constexpr std::uint64_t kLargestWholeFile = 256ULL << 20;

bool fileExists(const std::string& path);
/// Whether it is a folder (links are followed).
bool isDirectory(const std::string& path);
bool isRegularFile(const std::string& path);

/// Whether this user may read the file; else false and an error. It need not hold anything readable.
bool mayRead(const std::string& path, Error* error = nullptr);
/// Whether this user may write it, or make files in it if it is a folder.
bool mayWrite(const std::string& path);

/// Opens a regular file to be read, without ever waiting; with `status`, tells what the system knows of it.
/// None, and an error: no such file, a folder, a pipe or a device.
FileDescriptor openRegularFile(const std::string& path, Error* error = nullptr,
                               struct stat* status = nullptr);

/// The bytes of a regular file, or nothing and an error: no such file, a folder or device, over `limit`.
std::optional<std::vector<std::uint8_t>> readFile(const std::string& path, Error* error = nullptr,
                                                  std::uint64_t limit = kLargestWholeFile);
/// The file as text, which must be UTF-8.
std::optional<std::string> readTextFile(const std::string& path, Error* error = nullptr);

/// Replaces the file at `path` (or makes it) so that at any instant, and after a crash at any instant, either
/// the old or the new contents stand there, whole. See `replaceFileByPieces` for how, and for what the new
/// file takes over.
bool replaceFile(const std::string& path, std::string_view bytes, Error* error = nullptr);

}  // namespace qvct
