// The program in which `indexLibrary` has items described: qvct-index-worker SERVICES
// FOLDER..., the folders that are indexed.

#include "contentdb/ContentDescriber.h"
#include "contentdb/IndexWorker.h"

#include <algorithm>
#include <cstdlib>
#include <string>
#include <vector>

int main(int argc, char** argv) {
    using namespace qvct::contentdb;
    constexpr int decimal = 10;
    const std::uint64_t services = argc > 1 ? std::strtoull(argv[1], nullptr, decimal) : 0;
    const std::vector<std::string> folders(argv + std::min(argc, 2), argv + argc);
    return runIndexWorker([&] { return std::make_unique<ContentDescriber>(services, folders); });
}
