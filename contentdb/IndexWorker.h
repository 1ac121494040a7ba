#pragma once

#include "contentdb/IndexedItem.h"
#include "platform/base/Export.h"

namespace qvct::contentdb {

/// Describes items for the process that has started this one, until that one needs no more: the whole of a
/// program that a host names in `IndexOptions::worker`. Answers the status to end with.
///
/// The files that replace resources are those of that process by the time the factory is called; messages of
/// the log go there. Standard input and output cannot be used. Takes the signal SIGALRM (`HardLimit`), so
/// that a rule's script that cannot be stopped ends this process.
QVCT_API int runIndexWorker(const DescriberFactory& factory);

}  // namespace qvct::contentdb
