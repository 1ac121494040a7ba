#pragma once

#include <cstddef>

namespace qvct::contentdb {

/// Name under which the layer below is known to SQLite.
inline constexpr const char* kChecksumVfs = "qvct-checksum";
/// Every page of a content database has this size, and this many bytes at its end are its checksum.
inline constexpr int kPageSize = 8192;
inline constexpr int kChecksumBytes = 8;

/// Puts a layer between SQLite and the file: each page of the database is written with a checksum of its
/// bytes and its place, and read only if that is right, so that a flipped bit is told ("damaged") instead of
/// believed.
///
/// The log of a database in write-ahead mode has checksums of its own, which SQLite checks when it is opened.
/// Safe to call any number of times, from one thread first.
void registerChecksumVfs();

}  // namespace qvct::contentdb
