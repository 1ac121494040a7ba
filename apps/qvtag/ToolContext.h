#pragma once

#include "formats/library/LinkRule.h"
#include "output/Output.h"
#include "platform/base/Error.h"
#include "platform/text/Url.h"

#include <cstddef>
#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::tool {

/// What the commands share: the options before the command's name, where output goes, and what went wrong.
class ToolContext {
  public:
    ToolContext();

    // Set by the command line.
    Format format = Format::table;
    bool quiet = false;
    std::string resourceDirectory;
    std::string taxonomyFile;

    /// Applies the options above before a command runs.
    void prepare();
    const Terminal& terminal() const { return terminal_; }

    /// Prints one line on standard error, unless the library logged the same; the exit status will say that
    /// some items failed.
    void itemFailed(const Error& error);
    void itemFailed(std::string_view message);
    /// The same for a failure that the log has reported already.
    void loggedFailure();
    /// The same for a wrong word on the command line when the rest is done anyway; the exit status will be
    /// that of wrong usage.
    void usageFailed(std::string_view message);
    /// Prints a line on standard error that is no failure; nothing when quiet.
    void note(std::string_view message) const;
    /// 0 done, 1 some items failed, 2 wrong usage.
    int exitStatus() const { return exitStatus_; }
    /// Whether `usageFailed` was called.
    bool isUsageWrong() const { return exitStatus_ == 2; }

    /// Calls `show` for every content item at or below the paths as it is found, until output is lost. What
    /// cannot be read is reported. Names that are not UTF-8 are reported and left out. One note lists the
    /// links that are not followed.
    void forEachContentItem(const std::vector<std::string>& paths, LinksOutside links,
                            const std::function<void(const URL&)>& show);
    /// The same, with the path below which it was found.
    void forEachContentItemBelow(const std::vector<std::string>& paths, LinksOutside links,
                                 const std::function<void(const URL&, const std::string& root)>& show);
    /// The content items at or below the paths, all found before anything is done with one.
    std::vector<URL> contentItems(const std::vector<std::string>& paths, LinksOutside links);
    /// Prints that note for a command that walks by itself; nothing when there are no links.
    void notePassedOver(const std::vector<URL>& links) const;

  private:
    class LoggedLines;

    Terminal terminal_;
    std::shared_ptr<LoggedLines> logged_;
    int exitStatus_ = 0;
};

}  // namespace qvct::tool
