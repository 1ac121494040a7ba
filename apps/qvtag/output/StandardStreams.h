#pragma once

#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct::tool {

// All output of the tool goes through here, and none of these functions throws: a full disk, a closed stream
// or a reader that has gone must not keep a command from writing the items that it was asked to write.

/// Makes the streams safe to write to. A stream that the caller has closed is opened in a way that using it
/// still fails: otherwise the next file to be opened would take its place, and messages would be written into
/// it. Writing to a pipe that nobody reads becomes an ordinary error. To be called before anything else.
void prepareStandardStreams();

/// Writes to standard output.
void printText(std::string_view text);
/// Flushes standard output.
void flushOutput();
/// Writes to standard error, after everything that was written to standard output before. If this is lost,
/// nothing reports it: the exit status shows every failure anyway.
void printErrorText(std::string_view text);

template <typename... Arguments>
void print(fmt::format_string<Arguments...> format, Arguments&&... arguments) {
    printText(fmt::format(format, std::forward<Arguments>(arguments)...));
}

template <typename... Arguments>
void printError(fmt::format_string<Arguments...> format, Arguments&&... arguments) {
    printErrorText(fmt::format(format, std::forward<Arguments>(arguments)...));
}

/// Whether some of the standard output was lost: a command that only shows something may as well end then.
bool isOutputLost();
/// Flushes and closes standard output. Says on standard error why output was lost, unless its reader has
/// gone, as in `| head`.
/// @return  Whether all of the output was written.
bool finishOutput();

}  // namespace qvct::tool
