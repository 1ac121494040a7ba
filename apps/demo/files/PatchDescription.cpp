#include "demo/files/PatchDescription.h"

#include "demo/files/AudioFiles.h"

#include <stdexcept>

#include <fmt/format.h>
#include <zlib.h>
#include <zstd.h>

namespace qvct::demo {
namespace {

std::string escaped(std::string_view text) {
    std::string result;
    for (const char character : text) {
        switch (character) {
            case '&':
                result += "&amp;";
                break;
            case '<':
                result += "&lt;";
                break;
            case '>':
                result += "&gt;";
                break;
            case '"':
                result += "&quot;";
                break;
            default:
                result += character;
        }
    }
    return result;
}

std::string pluginXml(const Plugin& plugin) {
    std::string text = fmt::format(
        "        <Plugin name=\"{}\" settingName=\"{}\" bypassed=\"{}\">\n          <Parameters>\n",
        escaped(plugin.name), escaped(plugin.settingName), plugin.bypassed ? 1 : 0);
    for (const Parameter& parameter : plugin.parameters) {
        text += fmt::format("            <Parameter name=\"{}\" value=\"{}\" valueString=\"{}\"/>\n",
                            escaped(parameter.name), parameter.value, escaped(parameter.valueString));
    }
    return text + "          </Parameters>\n        </Plugin>\n";
}

std::string channelXml(const Channel& channel) {
    std::string text = fmt::format("    <Channel name=\"{}\" type=\"{}\" mode=\"{}\">\n      <Plugins>\n",
                                   escaped(channel.name), channel.type, channel.mode);
    for (const Plugin& plugin : channel.plugins) text += pluginXml(plugin);
    return text + "      </Plugins>\n    </Channel>\n";
}

std::string deflated(const std::string& text, int windowBits) {
    z_stream stream{};
    if (deflateInit2(&stream, Z_BEST_COMPRESSION, Z_DEFLATED, windowBits, 8, Z_DEFAULT_STRATEGY) != Z_OK) {
        throw std::runtime_error("zlib cannot start");
    }
    std::string result(deflateBound(&stream, text.size()), '\0');
    stream.next_in = const_cast<Bytef*>(reinterpret_cast<const Bytef*>(text.data()));
    stream.avail_in = static_cast<uInt>(text.size());
    stream.next_out = reinterpret_cast<Bytef*>(result.data());
    stream.avail_out = static_cast<uInt>(result.size());
    const int status = deflate(&stream, Z_FINISH);
    result.resize(stream.total_out);
    deflateEnd(&stream);
    if (status != Z_STREAM_END) throw std::runtime_error("zlib cannot compress");
    return result;
}

std::string zstandard(const std::string& text) {
    std::string result(ZSTD_compressBound(text.size()), '\0');
    const std::size_t size = ZSTD_compress(result.data(), result.size(), text.data(), text.size(), 9);
    if (ZSTD_isError(size) != 0) throw std::runtime_error(ZSTD_getErrorName(size));
    result.resize(size);
    return result;
}

}  // namespace

std::string xml(const PatchDescription& patch) {
    std::string text =
        fmt::format("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Patch name=\"{}\">\n  <Channels>\n",
                    escaped(patch.name));
    for (const Channel& channel : patch.channels) text += channelXml(channel);
    return text + "  </Channels>\n</Patch>\n";
}

std::string compressed(const std::string& text, Compression compression) {
    constexpr int kZlibWindow = MAX_WBITS;
    constexpr int kGzipWindow = MAX_WBITS + 16;
    switch (compression) {
        case Compression::none:
            return text;
        case Compression::zlib:
            return deflated(text, kZlibWindow);
        case Compression::gzip:
            return deflated(text, kGzipWindow);
        case Compression::zstandard:
            return zstandard(text);
    }
    throw std::invalid_argument("unknown compression");
}

void writeCache(const std::string& base, const PatchDescription& patch, Compression compression) {
    const char* extension = compression == Compression::none ? ".xml" : ".zxml";
    writeFile(base + extension, compressed(xml(patch), compression));
}

}  // namespace qvct::demo
