// Speed of the loop-file library beside its baselines in the same run: reading the metadata of real WAV and
// AIFF files beside TagLib's open with properties, and writing a tag beside a copy of the file.
//
//   bench_loop_files [folder of sounds] [folder to write in]
#include "Measure.h"
#include "media/loopfile/LCFileParser.h"
#include "media/loopfile/LCFileWriter.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>
#ifdef QVCT_HAS_TAGLIB
#include <taglib/fileref.h>
#include <taglib/tag.h>
#endif

namespace {

using namespace qvct;
namespace fs = std::filesystem;

/// Medians of several works, run in turn so that the machine's moods meet all of them alike. None begins
/// while what an earlier one wrote is still on its way to the disk.
std::vector<double> medians(int rounds, const std::vector<std::function<void()>>& works) {
    std::vector<std::vector<double>> times(works.size());
    for (int round = 0; round < rounds; ++round) {
        for (std::size_t i = 0; i < works.size(); ++i) {
            ::sync();
            times[i].push_back(bench::secondsOf(works[i]));
        }
    }
    std::vector<double> result;
    for (auto& each : times) result.push_back(bench::medianOf(std::move(each)));
    return result;
}

std::vector<std::string> soundsBelow(const fs::path& folder) {
    std::vector<std::string> files;
    for (const auto& entry : fs::recursive_directory_iterator(folder)) {
        const std::string extension = entry.path().extension().string();
        const bool isSound =
            extension == ".wav" || extension == ".aif" || extension == ".aiff" || extension == ".aifc";
        if (entry.is_regular_file() && isSound) files.push_back(entry.path().string());
    }
    std::sort(files.begin(), files.end());
    return files;
}

// What a work finds out goes here, so that no compiler drops the work.
volatile std::uint64_t sink = 0;

void readOurs(const std::vector<std::string>& files) {
    for (const std::string& file : files) {
        const auto data = LCFileParser::fileParserForURL(URL::fileURLWithPath(file))->enhancedFileData();
        if (data) sink = sink + data->frameCount();
    }
}

#ifdef QVCT_HAS_TAGLIB
void readTagLib(const std::vector<std::string>& files) {
    for (const std::string& file : files) {
        const TagLib::FileRef opened(file.c_str(), true, TagLib::AudioProperties::Average);
        if (!opened.isNull() && opened.audioProperties() != nullptr) {
            sink = sink + static_cast<std::uint64_t>(opened.audioProperties()->lengthInMilliseconds());
        }
    }
}
#endif

void benchReading(const fs::path& folder) {
    const auto files = soundsBelow(folder);
    if (files.empty()) {
        fmt::print("read: no sounds below {}\n", folder.string());
        return;
    }
    const double perFile = 1e6 / static_cast<double>(files.size());
    std::vector<std::function<void()>> works{[&] { readOurs(files); }};
#ifdef QVCT_HAS_TAGLIB
    works.emplace_back([&] { readTagLib(files); });
#endif
    readOurs(files);  // warm
    const auto times = medians(201, works);
    bench::printRow(fmt::format("{} WAV and AIFF files read, warm", files.size()),
                    fmt::format("{:.2f} µs a file", times[0] * perFile), "");
    if (times.size() == 1) return;
    bench::printRow("  opened with properties by TagLib", fmt::format("{:.2f} µs a file", times[1] * perFile),
                    "");
    bench::printRow("  ratio", fmt::format("{:.2f}", times[1] / times[0]), "at least 2");
}

void flush(const fs::path& file) {
    const int descriptor = ::open(file.c_str(), O_RDONLY | O_CLOEXEC);
    ::fsync(descriptor);
    ::close(descriptor);
}

void copyFile(const fs::path& from, const fs::path& to) {
    fs::copy_file(from, to, fs::copy_options::overwrite_existing);
}

void copyByTool(const fs::path& from, const fs::path& to) {
    const std::string command = fmt::format("cp '{}' '{}'", from.string(), to.string());
    if (std::system(command.c_str()) != 0) std::abort();
}

void makeWav(const fs::path& path, std::uint32_t frames) {
    const auto number = [](std::uint32_t value) {
        std::string bytes;
        for (unsigned shift = 0; shift < 32; shift += 8) bytes += static_cast<char>(value >> shift & 0xFFU);
        return bytes;
    };
    const std::uint32_t size = frames * 4;
    std::string bytes = "RIFF" + number(36 + size) + "WAVEfmt " + number(16) + number(0x00020001) +
                        number(44100) + number(44100 * 4) + number(0x00100004) + "data" + number(size);
    std::uint32_t state = 1;
    while (bytes.size() < 44 + size) bytes += number(state = state * 1664525U + 1013904223U);
    std::ofstream(path, std::ios::binary).write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
}

void writeTag(const fs::path& path, int& count) {
    const URL url = URL::fileURLWithPath(path.string());
    const auto data = LCFileParser::fileParserForURL(url)->fileData();
    data->setTaggingDictionary({{"Genres", PropertyList::Array{fmt::format("Tag {}", ++count)}}});
    Error error;
    if (LCFileWriter::fileWriterForURL(url)->writeFileData(data, &error)) return;
    fmt::print(stderr, "{}\n", error.message());
    std::exit(1);
}

void benchWriting(const fs::path& folder) {
    const fs::path file = folder / "qvct-bench.wav";
    const fs::path other = folder / "qvct-bench-copy.wav";
    int count = 0;
    for (const std::uint32_t frames : {50'000U, 2'500'000U, 25'000'000U}) {
        makeWav(file, frames);
        flush(file);
        const auto times = medians(11, {[&] { writeTag(file, count); },
                                        [&] {
                                            copyFile(file, other);
                                            flush(other);
                                        },
                                        [&] {
                                            copyByTool(file, other);
                                            flush(other);
                                        },
                                        [&] { copyByTool(file, other); }});
        const auto compared = [&](std::size_t which) {
            return fmt::format("{:.2f} ms, {:.2f} of it", times[which] * 1e3, times[0] / times[which]);
        };
        bench::printRow(fmt::format("a tag written into a file of {:.1f} MB", frames * 4e-6),
                        fmt::format("{:.2f} ms", times[0] * 1e3), "");
        bench::printRow("  a copy by us, flushed", compared(1), "at most 1");
        bench::printRow("  a copy by cp, flushed", compared(2), "at most 1");
        bench::printRow("  a copy by cp, not flushed", compared(3), "");
    }
    fs::remove(file);
    fs::remove(other);
}

}  // namespace

int main(int count, char** arguments) {
    benchReading(count > 1 ? arguments[1] : QVCT_CORPUS "/audio");
    benchWriting(count > 2 ? fs::path(arguments[2]) : fs::temp_directory_path());
    return 0;
}
