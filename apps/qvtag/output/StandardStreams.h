#pragma once

#include <string_view>
#include <utility>

#include <fmt/format.h>

namespace qvct::tool {

// All that the tool says goes through here, and nothing of it throws: a full disk, a closed stream or a
// reader that has gone must not keep a command from writing the items that it was asked to write.

/// Makes the streams safe to write to. A stream that the caller has closed is opened again for nothing: the
/// next file to be opened would take its place otherwise, and messages would end in it. To write to a pipe
/// that nobody reads becomes an error like others. To be called before anything else.
void prepareStandardStreams();

/// Writes to standard output.
void printText(std::string_view text);
/// Writes what was held back to standard output.
void flushOutput();
/// Writes to standard error, behind all that was written to standard output. What is lost there is not told
/// anywhere: the exit status tells of every failure without it.
void printErrorText(std::string_view text);

template <typename... Arguments>
void print(fmt::format_string<Arguments...> format, Arguments&&... arguments) {
    printText(fmt::format(format, std::forward<Arguments>(arguments)...));
}

template <typename... Arguments>
void printError(fmt::format_string<Arguments...> format, Arguments&&... arguments) {
    printErrorText(fmt::format(format, std::forward<Arguments>(arguments)...));
}

/// Whether something of standard output was lost: a command that only shows something may as well end.
bool isOutputLost();
/// Writes what is still held back, and closes standard output. Says on standard error why output was lost,
/// unless its reader has gone, as that of `| head` does.
/// @return  Whether all of the output was written.
bool finishOutput();

}  // namespace qvct::tool
