#include "contentdb/index/WorkerSettings.h"

#include "autotagging/ResourceFiles.h"
#include "contentdb/store/codec/ItemCodec.h"
#include "platform/files/ResourceBundle.h"

#include <optional>

namespace qvct::contentdb {

std::string encodedWorkerSettings() {
    ByteWriter out;
    out.text(ResourceBundle::directory());
    for (const ResourceFile& resource : resourceFiles()) {
        // Decided here, so that every worker uses the same file and a broken one is reported only once.
        const auto path = replacementFile(resource);
        out.text(path.value_or(std::string()));
    }
    return out.take();
}

void applyWorkerSettings(std::string_view settings) {
    ByteReader in(settings);
    ResourceBundle::setDirectory(std::string(in.text()));
    for (const ResourceFile& resource : resourceFiles()) {
        const std::string path(in.text());
        ResourceBundle::setPathForResource(resource.name, resource.extension,
                                           path.empty() ? std::nullopt : std::optional(path));
    }
}

}  // namespace qvct::contentdb
