#pragma once

#include <cstddef>

namespace qvct::contentdb {

/// Name under which the layer below is known to SQLite.
inline constexpr const char* kChecksumVfs = "qvct-checksum";
/// Every page of a content database has this size, and this many bytes at its end are its checksum.
inline constexpr int kPageSize = 8192;
inline constexpr int kChecksumBytes = 8;

/// Puts a layer between SQLite and the file: each page of the database is written with a checksum of its
/// bytes and its place, and reading a page whose checksum is wrong fails ("damaged"), so that a flipped bit
/// is never believed.
///
/// The write-ahead log has checksums of its own, which SQLite checks when it opens the log. May be called any
/// number of times; the first call must have returned before other threads call it.
void registerChecksumVfs();

}  // namespace qvct::contentdb
