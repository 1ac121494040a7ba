#include "formats/ItemFile.h"

#include "listening/Listener.h"
#include "media/audio/AudioDecoder.h"
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

std::shared_ptr<const HeardSound> ItemFile::sound(Listener& listener, Error* error) {
    if (!sound_) {
        sound_.emplace();
        const auto file = reader(&sound_->error);
        const auto decoder = file ? AudioDecoder::open(file, url_.path(), &sound_->error) : nullptr;
        if (decoder) sound_->value = std::make_shared<const HeardSound>(listener.listen(*decoder));
    }
    return sound_->answer(error);
}

std::optional<std::vector<std::uint8_t>> ItemFile::bytes(std::uint64_t limit, Error* error) {
    const auto file = reader(error);
    return file ? readAll(*file, url_.path(), limit, error) : std::nullopt;
}

}  // namespace qvct
