#pragma once

#include "contentdb/Indexer.h"

#include <string>

namespace qvct::contentdb {

/// The path of the program that is named, or else of our own: where the environment variable
/// QVCT_INDEX_WORKER says, beside the library or the program that has this code, or where it is installed.
/// Empty when the system does not say where this code lies.
std::string pathOfWorkerProgram(const WorkerProgram& program);

}  // namespace qvct::contentdb
