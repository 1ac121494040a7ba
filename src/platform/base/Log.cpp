#include "platform/base/Log.h"

#include <mutex>
#include <string>
#include <utility>

#include <fmt/format.h>
#include <spdlog/sinks/stdout_sinks.h>
#include <spdlog/spdlog.h>

namespace qvct {
namespace {

std::mutex handlerMutex;
thread_local std::string currentPrefix;

LogHandler& currentHandler() {
    static LogHandler handler;
    return handler;
}

spdlog::logger& standardErrorLogger() {
    static const auto logger = [] {
        auto made =
            std::make_shared<spdlog::logger>("qvct", std::make_shared<spdlog::sinks::stderr_sink_mt>());
        made->set_pattern("%n: %v");
        return made;
    }();
    return *logger;
}

std::string onOneLine(std::string_view message) {
    std::string line;
    line.reserve(message.size());
    for (const char c : message) {
        const auto byte = static_cast<unsigned char>(c);
        if (c == '\n') {
            line += "\\n";
        } else if (byte < 0x20 || byte == 0x7f) {
            line += fmt::format("\\x{:02x}", byte);
        } else {
            line += c;
        }
    }
    return line;
}

}  // namespace

void log(std::string_view message) {
    const std::string line = currentPrefix + onOneLine(message);
    LogHandler handler;
    {
        const std::lock_guard lock(handlerMutex);
        handler = currentHandler();
    }
    if (handler) {
        handler(line);
    } else {
        standardErrorLogger().warn("{}", line);
    }
}

LogHandler setLogHandler(LogHandler handler) {
    const std::lock_guard lock(handlerMutex);
    return std::exchange(currentHandler(), std::move(handler));
}

LogScope::LogScope(std::string text) {
    currentPrefix = std::move(text);
}

LogScope::~LogScope() {
    currentPrefix.clear();
}

const std::string& LogScope::prefix() {
    return currentPrefix;
}

}  // namespace qvct
