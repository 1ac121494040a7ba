#include "resources/ReplacementFile.h"

#include "platform/base/Log.h"
#include "platform/files/FileAccess.h"
#include "platform/files/FileStamp.h"
#include "platform/files/ResourceBundle.h"
#include "platform/text/Text.h"
#include "resources/BuiltInFile.h"
#include "resources/LegacyMappingTable.h"
#include "resources/ResourceDictionary.h"

#include <algorithm>
#include <map>
#include <mutex>
#include <vector>

#include <fmt/format.h>

namespace qvct {
namespace {

bool isMappingTable(std::string_view text, const std::string& path, Error* error) {
    const std::vector<std::string> lines = split(replaceAll(text, "\r\n", "\n"), "\n");
    if (lines.front() != kLegacyMappingHeader)
        return fail(error, kErrorMalformed, "is not the expected header", {.path = path, .line = 1});
    for (std::size_t i = 1; i < lines.size(); ++i) {
        const auto separators = std::count(lines[i].begin(), lines[i].end(), ';');
        if (lines[i].empty() || separators + 1 == kLegacyMappingFieldCount) continue;
        return fail(error, kErrorMalformed,
                    fmt::format("does not have {} fields", std::size_t{kLegacyMappingFieldCount}),
                    {.path = path, .line = i + 1});
    }
    return true;
}

bool isUsable(const ResourceFile& resource, const std::string& path, Error* error) {
    if (resource.isUsable != nullptr) return resource.isUsable(path, error);
    if (resource.extension == "plist") return readResourceDictionary(resource.name, path, error).has_value();
    const auto text = readTextFile(path, error);
    return text && (!resource.name.ends_with("TaxonomyMapping") || isMappingTable(*text, path, error));
}

/// An installation has copies of the built-in files beside it, which need not be read as something else.
bool isBuiltIn(const ResourceFile& resource, const std::string& path, FileStamp stamp) {
    const auto builtIn = builtInFile(resource.name, resource.extension);
    if (stamp.size != builtIn.size()) return false;
    const auto bytes = readFile(path);
    return bytes && std::equal(bytes->begin(), bytes->end(), builtIn.begin(), builtIn.end());
}

/// Whether a file is to be used, and the state that it was in then; without an error for one that says what
/// is built in.
struct Verdict {
    FileStamp stamp;
    bool isUsable = false;
    Error error;
};

Verdict judge(const ResourceFile& resource, const std::string& path, FileStamp stamp) {
    Verdict verdict{stamp, false, {}};
    if (isBuiltIn(resource, path, stamp)) return verdict;
    verdict.isUsable = isUsable(resource, path, &verdict.error);
    if (!verdict.isUsable) verdict.error.reason += " (using the built-in one)";
    return verdict;
}

/// The latest verdict on each file, by path. There are no more of them than resources.
class Verdicts {
  public:
    std::optional<Verdict> of(const std::string& path, FileStamp stamp) {
        const std::lock_guard lock(mutex_);
        const auto known = verdicts_.find(path);
        const bool isOfNow = known != verdicts_.end() && known->second.stamp == stamp;
        return isOfNow ? std::optional(known->second) : std::nullopt;
    }

    /// Keeps the verdict. False when another thread has reached the same one meanwhile.
    bool set(const std::string& path, const Verdict& verdict) {
        const std::lock_guard lock(mutex_);
        const auto [known, isFirst] = verdicts_.try_emplace(path, verdict);
        const bool isNew = isFirst || known->second.stamp != verdict.stamp;
        known->second = verdict;
        return isNew;
    }

  private:
    std::mutex mutex_;
    std::map<std::string, Verdict> verdicts_;
};

}  // namespace

std::optional<std::string> replacementFile(const ResourceFile& resource, Error* error) {
    static Verdicts verdicts;
    auto path = ResourceBundle::pathForResource(resource.name, resource.extension);
    if (!path) return std::nullopt;
    const FileStamp stamp = FileStamp::ofFile(*path);
    auto verdict = verdicts.of(*path, stamp);
    if (!verdict) {
        verdict = judge(resource, *path, stamp);
        if (verdicts.set(*path, *verdict) && verdict->error.isSet()) log(verdict->error.message());
    }
    if (verdict->isUsable) return path;
    if (error != nullptr) *error = verdict->error;
    return std::nullopt;
}

}  // namespace qvct
