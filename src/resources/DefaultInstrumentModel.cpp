#include "resources/DefaultInstrumentModel.h"

#include "platform/files/FileAccess.h"
#include "resources/EmbeddedFiles.h"

#include <utility>

namespace qvct {
namespace {

constexpr std::uint64_t kLargestModel = 64U << 20U;

using Model = std::shared_ptr<const InstrumentModel>;

Model modelIn(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error, kLargestModel);
    auto model = bytes ? InstrumentModel::parse(*bytes, error) : std::nullopt;
    if (model) return std::make_shared<const InstrumentModel>(std::move(*model));
    failIn(path, error);
    return nullptr;
}

bool holdsModel(const std::string& path, Error* error) {
    return modelIn(path, error) != nullptr;
}

Model builtInModel() {
    static const Model model = std::make_shared<const InstrumentModel>(
        *InstrumentModel::parse({InstrumentModel_bin, InstrumentModel_bin_len}));
    return model;
}

}  // namespace

ResourceFile instrumentModelFile() {
    return {"InstrumentModel", "bin", holdsModel};
}

std::shared_ptr<const InstrumentModel> defaultInstrumentModel() {
    const auto path = replacementFile(instrumentModelFile());
    Model replaced = path ? modelIn(*path, nullptr) : nullptr;
    return replaced != nullptr ? replaced : builtInModel();
}

}  // namespace qvct
