#pragma once

#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"

namespace qvct::contentdb {

/// Describes items for the process that started this one, for as long as it needs them: this is all that the
/// `main` of a program named in `IndexOptions::worker` has to do. Returns the exit status.
///
/// When the factory is called, the files that replace resources are already those of the parent process; log
/// messages of any thread go to the parent, as long as this runs. Standard input and output cannot be used.
/// Takes the signal SIGALRM (`HardLimit`), so that a rule's script that cannot be stopped ends this process.
///
/// When the parent needs no more, this returns, and `main` has a second to do so. It does not return when the
/// run is interrupted, when the parent ends, or when an item takes too long: then the process is killed.
QVCT_API int runIndexWorker(const DescriberFactory& factory);

}  // namespace qvct::contentdb
