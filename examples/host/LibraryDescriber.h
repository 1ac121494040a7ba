#pragma once

#include <memory>

#include <qvcontenttagging/contentdb/IndexedItem.h>

/// Describes items for the database: what they store about themselves, and what their names tell.
std::unique_ptr<qvct::contentdb::ItemDescriber> makeLibraryDescriber();
