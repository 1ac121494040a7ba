#pragma once

#include "listening/instrument/InstrumentModel.h"
#include "resources/ReplacementFile.h"

#include <memory>

namespace qvct {

/// The resource file that holds the model: docs/formats/instrument-model.md.
ResourceFile instrumentModelFile();

/// The model in the resource folder, or the built-in one; never null.
/// @cost  Half a millisecond the first time; then one look at the file, and reading it when it replaces the
/// built-in one. Safe from every thread.
std::shared_ptr<const InstrumentModel> defaultInstrumentModel();

}  // namespace qvct
