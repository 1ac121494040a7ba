#include "demo/files/AudioFiles.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <system_error>

namespace qvct::demo {

void writeFile(const std::string& path, std::string_view bytes) {
    const std::filesystem::path file(path);
    if (file.has_parent_path()) std::filesystem::create_directories(file.parent_path());
    errno = 0;
    std::ofstream stream(file, std::ios::binary | std::ios::trunc);
    stream.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    stream.close();
    if (!stream) throw std::system_error(errno, std::generic_category(), path);
}

void writeWav(const std::string& path, const Sound& sound) {
    writeFile(path, wavBytes(sound));
}
void writeAiff(const std::string& path, const Sound& sound) {
    writeFile(path, aiffBytes(sound));
}
void writeCaf(const std::string& path, const Sound& sound) {
    writeFile(path, cafBytes(sound));
}

void writeSound(const std::string& path, const Sound& sound) {
    const std::string extension = std::filesystem::path(path).extension().string();
    if (extension == ".wav") return writeWav(path, sound);
    if (extension == ".aif" || extension == ".aiff") return writeAiff(path, sound);
    if (extension == ".caf") return writeCaf(path, sound);
    throw std::invalid_argument(path + ": no audio file format has this extension");
}

}  // namespace qvct::demo
