#pragma once

#include <string>

namespace qvct::contentdb {

/// The path of the database that a host names so: links are followed, whether or not a database exists there.
std::string pathOfDatabase(const std::string& name);

/// Makes an empty file for a new database, as private as `model` if that exists.
void makeEmptyLike(const std::string& model, const std::string& path);

/// Whether the file carries the mark of a content database, damaged or not.
bool isMarkedAsContentDatabase(const std::string& path);

/// Removes what there is of a database and its logs.
void removeDatabase(const std::string& path);

/// Where a database is built before it is moved to `database`, which is therefore complete or absent.
std::string unfinishedPath(const std::string& database);

/// @{
/// How a damaged database is replaced, so that the old or the new one is found after a crash at any instant:
/// the unfinished database, whole and closed by then, is declared rebuilt ("<database>.rebuilt"); the old one
/// is put aside ("<database>.damaged"), and then the rebuilt one, if there is one, is put into its place.
/// Calling `putAside` again goes on where an interrupted call stopped; it answers the name of the old one.
/// The caller must hold the RunLock.
/// @throws DatabaseFailure when a file cannot be moved.
void declareRebuilt(const std::string& database);
bool isRebuilt(const std::string& database);
std::string putAside(const std::string& database);
/// @}

}  // namespace qvct::contentdb
