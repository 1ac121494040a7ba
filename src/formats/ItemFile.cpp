#include "formats/ItemFile.h"

#include "media/loopfile/LCFileParser.h"
#include "platform/files/reading/RandomAccessReader.h"

namespace qvct {

ItemFile::ItemFile(URL url) : url_(std::move(url)) {}

ItemFile::~ItemFile() = default;

std::shared_ptr<const RandomAccessReader> ItemFile::reader(Error* error) {
    if (!reader_) {
        reader_.emplace();
        reader_->value = FileReader::open(url_.path(), &reader_->error);
    }
    return reader_->answer(error);
}

std::shared_ptr<LCFileData> ItemFile::audio(Error* error) {
    if (!audio_) {
        audio_.emplace();
        if (const auto file = reader(&audio_->error))
            audio_->value =
                LCFileParser::fileParserForReader(file, url_.path())->enhancedFileData(&audio_->error);
    }
    return audio_->answer(error);
}

std::optional<std::vector<std::uint8_t>> ItemFile::bytes(std::uint64_t limit, Error* error) {
    const auto file = reader(error);
    return file ? readAll(*file, url_.path(), limit, error) : std::nullopt;
}

}  // namespace qvct
