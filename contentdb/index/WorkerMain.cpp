// The program in which `indexLibrary` has items described: qvct-index-worker SERVICES.

#include "contentdb/ContentDescriber.h"
#include "contentdb/IndexWorker.h"

#include <cstdlib>

int main(int argc, char** argv) {
    using namespace qvct::contentdb;
    constexpr int decimal = 10;
    const std::uint64_t services = argc > 1 ? std::strtoull(argv[1], nullptr, decimal) : 0;
    return runIndexWorker([services] { return std::make_unique<ContentDescriber>(services); });
}
