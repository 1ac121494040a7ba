#include "resources/DefaultListeningModels.h"

#include "platform/files/FileAccess.h"
#include "resources/EmbeddedFiles.h"

#include <span>
#include <utility>

namespace qvct {
namespace {

constexpr std::uint64_t kLargestModel = 64U << 20U;

template <typename Model>
std::shared_ptr<const Model> modelIn(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error, kLargestModel);
    auto model = bytes ? Model::parse(*bytes, error) : std::nullopt;
    if (model) return std::make_shared<const Model>(std::move(*model));
    failIn(path, error);
    return nullptr;
}

template <typename Model>
bool holdsModel(const std::string& path, Error* error) {
    return modelIn<Model>(path, error) != nullptr;
}

template <typename Model>
std::shared_ptr<const Model> currentModel(const ResourceFile& file, std::span<const std::uint8_t> bytes) {
    static const auto builtIn = std::make_shared<const Model>(*Model::parse(bytes));
    const auto path = replacementFile(file);
    const auto replaced = path ? modelIn<Model>(*path, nullptr) : nullptr;
    return replaced != nullptr ? replaced : builtIn;
}

}  // namespace

ResourceFile instrumentModelFile() {
    return {"InstrumentModel", "bin", holdsModel<InstrumentModel>};
}

ResourceFile likenessModelFile() {
    return {"LikenessModel", "bin", holdsModel<LikenessModel>};
}

std::shared_ptr<const InstrumentModel> defaultInstrumentModel() {
    return currentModel<InstrumentModel>(instrumentModelFile(),
                                         {InstrumentModel_bin, InstrumentModel_bin_len});
}

std::shared_ptr<const LikenessModel> defaultLikenessModel() {
    return currentModel<LikenessModel>(likenessModelFile(), {LikenessModel_bin, LikenessModel_bin_len});
}

ListeningModels defaultListeningModels() {
    return {defaultInstrumentModel(), defaultLikenessModel()};
}

}  // namespace qvct
