#include "ToolContext.h"

#include "Resources.h"
#include "formats/ContentWalk.h"
#include "platform/Log.h"
#include "platform/Text.h"

#include <algorithm>
#include <cstdio>
#include <memory>
#include <mutex>
#include <set>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

void printLine(std::string_view message) {
    // Standard output first, so that the two streams interleave as they were written.
    std::fflush(stdout);
    fmt::print(stderr, "qvtag: {}\n", message);
}

/// The library logs a broken keyword or rule for every item that it meets; a person wants to read it once.
LogHandler printOnce() {
    const auto seen = std::make_shared<std::set<std::string, std::less<>>>();
    const auto mutex = std::make_shared<std::mutex>();
    return [seen, mutex](std::string_view message) {
        constexpr std::size_t enough = 1000;
        const std::lock_guard lock(*mutex);
        if (seen->size() < enough && seen->emplace(message).second) printLine(message);
    };
}

}  // namespace

ToolContext::ToolContext() : terminal_(Terminal::ofStandardOutput()) {
    setLogHandler(printOnce());
}

void ToolContext::prepare() {
    useResources(resourceDirectory, taxonomyFile, *this);
}

void ToolContext::itemFailed(std::string_view message) {
    printLine(message);
    loggedFailure();
}

void ToolContext::loggedFailure() {
    exitStatus_ = std::max(exitStatus_, 1);
}

void ToolContext::usageFailed(std::string_view message) {
    printLine(message);
    exitStatus_ = 2;
}

void ToolContext::note(std::string_view message) const {
    if (!quiet) printLine(message);
}

std::vector<URL> ToolContext::contentItems(const std::vector<std::string>& paths) {
    std::vector<URL> items;
    const auto add = [&](const URL& url) {
        if (isValidUtf8(url.path())) {
            items.push_back(url);
        } else {
            itemFailed(fmt::format("{}: the name is not UTF-8", printable(url.path())));
        }
    };
    for (const std::string& path : paths) {
        walkContent(path, add, [this](const Error& error) { itemFailed(error.message); });
    }
    return items;
}

}  // namespace qvct::tool
