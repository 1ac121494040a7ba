// A worker program as a host may have one: its describer crashes and hangs where it is told to. What it logs
// when it is no worker any more goes to the file that QVCT_TEST_NOTE names.

#include "NameDescriber.h"
#include "contentdb/IndexWorker.h"

#include <cstdlib>

int main() {
    const char* note = std::getenv("QVCT_TEST_NOTE");
    qvct::setLogHandler([note](std::string_view line) {
        if (note != nullptr) std::ofstream(note, std::ios::app) << line << ';';
    });
    const int status =
        qvct::contentdb::runIndexWorker([] { return std::make_unique<qvct::test::NameDescriber>(); });
    qvct::log("over");
    return status;
}
