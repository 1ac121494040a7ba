#pragma once

#include <string>

namespace qvct::contentdb {

/// Removes what there is of a database and its logs.
void removeDatabase(const std::string& path);

/// The files by which a damaged database is replaced, so that at any instant, also after a crash, the old or
/// the new one can be found: the new one is built as "<database>.unfinished", becomes "<database>.rebuilt"
/// when it is whole, and takes the place of the old one when that has been put aside as "<database>.damaged".
///
/// Every function throws DatabaseFailure when a file cannot be moved, and wants the RunLock.
std::string unfinishedPath(const std::string& database);
/// Takes the unfinished database for whole, if there is one. It must be closed.
void declareRebuilt(const std::string& database);
bool isRebuilt(const std::string& database);
/// Puts the old database aside and the rebuilt one, if there is one, into its place; goes on where that was
/// interrupted before. The name of the old one.
std::string putAside(const std::string& database);

}  // namespace qvct::contentdb
