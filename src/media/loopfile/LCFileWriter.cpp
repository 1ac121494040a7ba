#include "media/loopfile/LCFileWriter.h"

#include "media/loopfile/LCFingerprint.h"
#include "media/loopfile/containers/Container.h"
#include "media/loopfile/containers/LoopDataFile.h"
#include "platform/data/PropertyListFile.h"
#include "platform/files/EditLock.h"
#include "platform/files/EntryStatus.h"
#include "platform/files/replacement/FileReplacement.h"
#include "platform/text/Text.h"

#include <fmt/format.h>

namespace qvct {
namespace {

/// A record that cannot be read is not overwritten: a newer version may have written it, or it may be
/// recoverable by other means.
bool isReadable(const Container& container, Error* error) {
    const Chunk* chunk = container.find(Chunk::Role::record);
    if (chunk == nullptr || chunk->size == 0) return true;
    const auto bytes = container.recordBytes();
    Error reason;
    const auto record = bytes ? parsePropertyList(*bytes, &reason, PropertyListUse::rewriting) : std::nullopt;
    if (record && record->dictionary() != nullptr) return true;
    return failAt(error, *chunk,
                  fmt::format("holds a record that cannot be read and is kept ({})",
                              record ? "no dictionary" : reason.message()));
}

bool holdsAlready(const Container& container, const std::string& record) {
    const auto bytes = container.recordBytes();
    if (!bytes) return record.empty() && container.find(Chunk::Role::record) == nullptr;
    return bytes->size() == record.size() &&
           std::equal(bytes->begin(), bytes->end(), record.begin(),
                      [](std::uint8_t a, char b) { return a == static_cast<std::uint8_t>(b); });
}

bool isSameOutsideOfTheRecord(const std::string& path, const LCFingerprint& before,
                              const std::string& newFile, Error* error) {
    Error reason;
    const auto reader = FileReader::open(newFile, &reason);
    const auto after = reader ? fingerprintOfReader(*reader, path, &reason) : std::nullopt;
    reason.path.clear();  // that of the new file, which is about to go
    const std::vector<std::string> differences =
        after ? before.differences(*after) : std::vector{reason.message()};
    if (differences.empty()) return true;
    return fail(error, kErrorUnwritable,
                "not written, since the new file differs: " + join(differences, "; "), {path});
}

bool makeLoopDataFile(const std::string& path, const std::string& record, const LCWriteOptions& how,
                      Error* error) {
    if (record.empty()) {
        return fail(error, kErrorInvalidArgument, "a loop data file cannot be without a record", {path});
    }
    const FilePiece whole{.bytes = record};
    FileReplacementOptions options;
    options.isDryRun = how.isDryRun;
    options.expected = how.expected.value_or(FileStamp{});
    return replaceFileByPieces(path, {&whole, 1}, options, error);
}

bool isMissing(const std::string& path) {
    EntryStatus status;
    return lookAt(path, Links::follow, status) == Presence::absent;
}

}  // namespace

LCFileWriter::LCFileWriter(std::string path, LCWriteOptions options)
    : path_(std::move(path)), options_(options) {}

std::shared_ptr<LCFileWriter> LCFileWriter::fileWriterForURL(const URL& url, LCWriteOptions options) {
    return std::shared_ptr<LCFileWriter>(new LCFileWriter(url.path(), options));
}

bool LCFileWriter::writeFileData(const std::shared_ptr<const LCFileData>& data, Error* error) const {
    if (!data) return fail(error, kErrorInvalidArgument, "there is no file data to write", {path_});
    const std::string record = data->record().empty()
                                   ? std::string{}
                                   : serializePropertyList(data->record(), PropertyListFormat::binary, error);
    if (record.empty() && !data->record().empty()) return failIn(path_, error);
    const auto turn = EditLock::acquire(path_, error);
    if (!turn) return false;
    if (LoopDataFile::isName(path_) && isMissing(path_))
        return makeLoopDataFile(path_, record, options_, error);

    const auto reader = FileReader::open(path_, error);
    if (!reader) return false;
    ReadWindow window(*reader);
    const auto container = Container::open(window, path_, error);
    LCAudioFacts facts;
    if (!container || !container->readFacts(facts, error) || !isReadable(*container, error)) {
        return failIn(path_, error);
    }
    if (holdsAlready(*container, record)) return true;
    const auto pieces = container->rewritten(record, error);
    if (!pieces) return failIn(path_, error);

    FileReplacementOptions options;
    options.keepsTimes = options_.keepsTimes;
    options.isDryRun = options_.isDryRun;
    options.expected = options_.expected.value_or(reader->stamp());
    if (options_.verifies) {
        const auto before = fingerprintOfReader(*reader, path_, error);
        if (!before) return false;
        options.check = [this, before = *before](const std::string& newFile, Error* checkError) {
            return isSameOutsideOfTheRecord(path_, before, newFile, checkError);
        };
    }
    return replaceFileByPieces(path_, *pieces, options, error);
}

}  // namespace qvct
