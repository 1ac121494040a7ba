#pragma once

#include "autotagging/ContentItem.h"

#include <string>

namespace qvct::contentdb {

/// 16 bytes for the content of an item apart from its record: the same wherever it lies and however it is
/// tagged. Empty when there is no such content, or it cannot be read.
///
/// What counts is the sound and the notes of audio, the text of a preset without the record, the files in a
/// bundle with their places, and any other settings file whole. Of a sound or file over 64 KB only the size
/// and 16 blocks at even distances are hashed, which is enough to tell recordings apart.
/// @cost  At most 17 reads for each file; what the item has open is not opened again.
std::string payloadHash(ContentItem& item);

}  // namespace qvct::contentdb
