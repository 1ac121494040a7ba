#include "contentdb/index/WorkerProgram.h"

#include "platform/base/ImagePath.h"
#include "platform/files/FileAccess.h"

#include <cstdlib>
#include <filesystem>

namespace qvct::contentdb {

std::string pathOfWorkerProgram(const WorkerProgram& program) {
    if (!program.path.empty()) return program.path;
    const char* fromEnvironment = std::getenv("QVCT_INDEX_WORKER");
    if (fromEnvironment != nullptr && *fromEnvironment != '\0') return fromEnvironment;
    const auto* code = reinterpret_cast<const void*>(&pathOfWorkerProgram);
    const std::filesystem::path folder = imagePath(code).parent_path();
    if (folder.empty()) return {};
    std::string path;
    for (const char* place : {"qvct-index-worker", QVCT_WORKER_FROM_PROGRAM, QVCT_WORKER_FROM_LIBRARY}) {
        path = (folder / place).lexically_normal().string();
        if (fileExists(path)) break;
    }
    return path;
}

}  // namespace qvct::contentdb
