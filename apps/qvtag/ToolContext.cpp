#include "ToolContext.h"

#include "Resources.h"
#include "formats/library/ContentWalk.h"
#include "output/StandardStreams.h"
#include "platform/base/Log.h"
#include "platform/text/Text.h"

#include <algorithm>
#include <memory>
#include <mutex>
#include <set>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

/// Whatever a message quotes, nothing but printable characters and line breaks goes to a terminal.
void printLine(std::string_view message) {
    std::string text = "qvtag: ";
    for (std::size_t end = message.find('\n'); end != std::string_view::npos; end = message.find('\n')) {
        text += printable(message.substr(0, end)) + '\n';
        message.remove_prefix(end + 1);
    }
    printErrorText(text + printable(message) + '\n');
}

}  // namespace

/// What the library logged, to be shown once: it logs the same for every item that meets a broken keyword or
/// rule.
class ToolContext::LoggedLines {
  public:
    void print(std::string_view message) {
        constexpr std::string_view kOfDataFiles = "Indexing ";
        if (message.starts_with(kOfDataFiles)) message.remove_prefix(kOfDataFiles.size());
        const std::lock_guard lock(mutex_);
        if (lines_.size() < kEnough && lines_.emplace(message).second) printLine(message);
    }
    bool contain(std::string_view message) {
        const std::lock_guard lock(mutex_);
        return lines_.contains(message);
    }

  private:
    static constexpr std::size_t kEnough = 1000;

    std::mutex mutex_;
    std::set<std::string, std::less<>> lines_;
};

ToolContext::ToolContext()
    : terminal_(Terminal::ofStandardOutput()), logged_(std::make_shared<LoggedLines>()) {
    setLogHandler([logged = logged_](std::string_view message) { logged->print(message); });
}

void ToolContext::prepare() {
    useResources(resourceDirectory, taxonomyFile, *this);
}

void ToolContext::itemFailed(const Error& error) {
    itemFailed(std::string_view(error.message()));
}

void ToolContext::itemFailed(std::string_view message) {
    if (!logged_->contain(message)) printLine(message);
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

void ToolContext::notePassedOver(const std::vector<URL>& links) const {
    if (links.empty()) return;
    const std::string all = links.size() == 1 ? "" : fmt::format(" (one of {} such links)", links.size());
    note(errorOf(kErrorInvalidArgument,
                 fmt::format("leads out of the folder and was passed over{}; --follow follows it", all),
                 {links.front().path()})
             .message());
}

void ToolContext::forEachContentItem(const std::vector<std::string>& paths, LinksOutside links,
                                     const std::function<void(const URL&)>& show) {
    forEachContentItemBelow(paths, links, [&show](const URL& url, const std::string&) { show(url); });
}

void ToolContext::forEachContentItemBelow(
    const std::vector<std::string>& paths, LinksOutside links,
    const std::function<void(const URL&, const std::string& root)>& show) {
    std::vector<URL> passedOver;
    std::string root;
    const auto visit = [&](const URL& url) {
        if (isValidUtf8(url.path())) {
            show(url, root);
        } else {
            itemFailed(errorOf(kErrorInvalidArgument, "the name is not UTF-8", {url.path()}));
        }
        return !isOutputLost();
    };
    for (const std::string& path : paths) {
        if (isOutputLost()) break;
        root = URL::fileURLWithPath(path).path();
        walkContent(path, visit, [this](const Error& error) { itemFailed(error); },
                    {links, [&passedOver](const URL& link) { passedOver.push_back(link); }});
    }
    notePassedOver(passedOver);
}

std::vector<URL> ToolContext::contentItems(const std::vector<std::string>& paths, LinksOutside links) {
    std::vector<URL> items;
    forEachContentItem(paths, links, [&items](const URL& url) { items.push_back(url); });
    return items;
}

}  // namespace qvct::tool
