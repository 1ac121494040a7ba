// A worker program as a host may have one: its describer crashes and hangs where it is told to.

#include "NameDescriber.h"
#include "contentdb/IndexWorker.h"

int main() {
    return qvct::contentdb::runIndexWorker([] { return std::make_unique<qvct::test::NameDescriber>(); });
}
