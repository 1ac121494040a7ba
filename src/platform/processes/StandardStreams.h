#pragma once

#include "platform/files/FileDescriptor.h"

#include <cstddef>
#include <optional>

namespace qvct {

/// Opens those standard streams that were closed when the program started, in a way that using them still
/// fails. Otherwise the next file to be opened would take their place, and messages would be written into it.
void openStandardStreams();

/// The same file under a number that is none of the standard streams'. A host may have closed these, so that
/// a new file gets the number of one, and would receive what is written there.
FileDescriptor besideStandardStreams(FileDescriptor file);

/// Makes writing to a pipe that nobody reads an ordinary error instead of a signal that ends the program. For
/// programs of our own.
void ignoreBrokenPipes();

enum class StandardStream { output, error };

/// Whether it is shown on a terminal.
bool isTerminal(StandardStream stream);
/// Columns of the terminal; nothing when it is none, or does not tell.
std::optional<std::size_t> columnsOf(StandardStream stream);
/// Closes the stream, since some systems report a full disk only then. Write buffered output before. False,
/// and `errno` says why, when not all was written.
bool closeStream(StandardStream stream);

}  // namespace qvct
