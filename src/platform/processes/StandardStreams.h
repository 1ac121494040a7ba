#pragma once

#include <cstddef>
#include <optional>

namespace qvct {

/// Opens those of the three standard streams that whoever started the program has closed, for nothing: the
/// next file to be opened would take their place otherwise, and what is meant for them would end in it. Using
/// them fails as before.
void openStandardStreams();

/// Makes writing to a pipe that nobody reads an error like others. For programs of our own.
void ignoreBrokenPipes();

enum class StandardStream { output, error };

/// Whether it is shown on a terminal.
bool isTerminal(StandardStream stream);
/// Columns of the terminal; nothing when it is none, or does not tell.
std::optional<std::size_t> columnsOf(StandardStream stream);
/// Closes it, since some systems tell of a full disk only then. What was held back is to be written before.
/// False, and `errno` says why, when not all was taken.
bool closeStream(StandardStream stream);

}  // namespace qvct
