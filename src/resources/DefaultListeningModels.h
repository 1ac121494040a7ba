#pragma once

#include "listening/Listener.h"
#include "listening/instrument/InstrumentModel.h"
#include "listening/likeness/LikenessModel.h"
#include "resources/ReplacementFile.h"

#include <memory>

namespace qvct {

/// The resource files that hold the models: docs/formats/instrument-model.md, likeness-model.md.
ResourceFile instrumentModelFile();
ResourceFile likenessModelFile();

/// The model in the resource folder, or the built-in one; never null.
/// @cost  Half a millisecond the first time; then one look at the file, and reading it when it replaces the
/// built-in one. Safe from every thread.
std::shared_ptr<const InstrumentModel> defaultInstrumentModel();
std::shared_ptr<const LikenessModel> defaultLikenessModel();

/// All that a listener needs.
ListeningModels defaultListeningModels();

}  // namespace qvct
