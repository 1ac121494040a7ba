#pragma once

#include "formats/ItemFile.h"

#include <string>

namespace qvct::contentdb {

/// 16 bytes for the content of an item apart from its record: the same wherever it lies and however it is
/// tagged. Empty when there is no such content, or it cannot be read.
///
/// Of audio the sound and the notes; of a preset its text without the record;
/// of a bundle the files in it with their places; of other settings the file. Of anything over 64 KB only 16
/// blocks at even distances count, and the size: that tells any two recordings apart.
/// @cost  At most 17 reads for each file; the item's own is not opened again.
std::string payloadHash(ItemFile& file);

}  // namespace qvct::contentdb
