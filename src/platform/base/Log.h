#pragma once

#include "platform/base/Export.h"

#include <functional>
#include <string>
#include <string_view>

namespace qvct {

/// Receives one message from the framework, without a line break at its end.
using LogHandler = std::function<void(std::string_view message)>;

/// Writes one line to the log. Line breaks and control characters inside the message are escaped.
///
/// Messages go to the handler if one is set, else to standard error. Safe from every thread.
QVCT_API void log(std::string_view message);

/// Sends all further messages to `handler`; an empty one brings standard error back. Returns the handler that
/// was set before, so that it can be restored.
QVCT_API LogHandler setLogHandler(LogHandler handler);

/// While it lives, messages of its thread begin with its prefix. Scopes do not nest.
class QVCT_API LogScope {
  public:
    /// Sets the prefix; when the scope ends, the one that it replaced does not come back.
    explicit LogScope(std::string prefix);
    LogScope(const LogScope&) = delete;
    LogScope& operator=(const LogScope&) = delete;
    ~LogScope();

    /// The prefix of this thread's messages; empty outside of a scope.
    static const std::string& prefix();
};

}  // namespace qvct
