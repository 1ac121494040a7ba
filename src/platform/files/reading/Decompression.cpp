#include "platform/files/reading/Decompression.h"

#include <algorithm>
#include <array>
#include <memory>

#include <fmt/format.h>
#include <zlib.h>
#include <zstd.h>

namespace qvct {
namespace {

using Bytes = std::span<const std::uint8_t>;

constexpr std::size_t kPieceSize = std::size_t{64} << 10;

/// What came out so far, kept within the bounds.
class BoundedOutput {
  public:
    explicit BoundedOutput(std::size_t inputSize)
        : limit_(inputSize > kLargestDecompressed / kHighestCompressionRatio
                     ? kLargestDecompressed
                     : inputSize * kHighestCompressionRatio) {}

    bool append(Bytes piece, Error* error) {
        if (piece.size() > limit_ - bytes_.size()) {
            return fail(error, kErrorTooLarge, fmt::format("compressed data grows beyond {} bytes", limit_));
        }
        bytes_.insert(bytes_.end(), piece.begin(), piece.end());
        return true;
    }

    std::vector<std::uint8_t> take() { return std::move(bytes_); }

  private:
    std::size_t limit_;
    std::vector<std::uint8_t> bytes_;
};

bool failAt(Error* error, std::string_view format, std::size_t offset, std::string_view reason) {
    return fail(error, kErrorMalformed, std::string(reason),
                {.part = fmt::format("{} data", format), .offset = offset});
}

bool beginsLikeGzip(Bytes bytes) {
    return bytes.size() >= 2 && bytes[0] == 0x1f && bytes[1] == 0x8b;
}

bool beginsLikeZlib(Bytes bytes) {
    return bytes.size() >= 2 && (bytes[0] & 0x0fU) == Z_DEFLATED && (bytes[0] * 256U + bytes[1]) % 31 == 0;
}

bool beginsLikeZstandard(Bytes bytes) {
    if (bytes.size() < 4) return false;
    const std::uint32_t magic = bytes[0] + bytes[1] * 0x100U + bytes[2] * 0x10000U + bytes[3] * 0x1000000U;
    return magic == ZSTD_MAGICNUMBER || (magic & ZSTD_MAGIC_SKIPPABLE_MASK) == ZSTD_MAGIC_SKIPPABLE_START;
}

struct InflateCloser {
    void operator()(z_stream* stream) const { inflateEnd(stream); }
};

/// Inflates to the end of a gzip member or zlib stream; `stream` then points behind it.
bool inflateToEnd(z_stream& stream, std::size_t inputSize, BoundedOutput& output, Error* error) {
    std::array<std::uint8_t, kPieceSize> piece;
    for (int status = Z_OK; status != Z_STREAM_END;) {
        stream.next_out = piece.data();
        stream.avail_out = piece.size();
        status = inflate(&stream, Z_NO_FLUSH);
        if (status != Z_OK && status != Z_STREAM_END) {
            const char* reason = status == Z_BUF_ERROR ? "cut short" : "damaged";
            return failAt(error, "deflated", inputSize - stream.avail_in, stream.msg ? stream.msg : reason);
        }
        if (!output.append({piece.data(), piece.size() - stream.avail_out}, error)) return false;
    }
    return true;
}

bool inflateAll(Bytes bytes, BoundedOutput& output, Error* error) {
    constexpr int kDetectHeader = MAX_WBITS + 32;
    z_stream stream{};
    stream.next_in = const_cast<Bytef*>(bytes.data());  // zlib does not write to its input
    stream.avail_in = static_cast<uInt>(bytes.size());
    if (inflateInit2(&stream, kDetectHeader) != Z_OK) return failAt(error, "deflated", 0, "no memory");
    const std::unique_ptr<z_stream, InflateCloser> closer(&stream);
    for (;;) {
        if (!inflateToEnd(stream, bytes.size(), output, error)) return false;
        if (stream.avail_in == 0) return true;
        if (!beginsLikeGzip({stream.next_in, stream.avail_in}) || inflateReset(&stream) != Z_OK) {
            return failAt(error, "deflated", bytes.size() - stream.avail_in, "something follows the end");
        }
    }
}

struct ZstandardCloser {
    void operator()(ZSTD_DStream* stream) const { ZSTD_freeDStream(stream); }
};

bool decodeZstandard(Bytes bytes, BoundedOutput& output, Error* error) {
    const std::unique_ptr<ZSTD_DStream, ZstandardCloser> stream(ZSTD_createDStream());
    if (!stream) return failAt(error, "Zstandard", 0, "no memory");
    std::vector<std::uint8_t> piece(kPieceSize);
    ZSTD_inBuffer in{bytes.data(), bytes.size(), 0};
    for (;;) {
        ZSTD_outBuffer out{piece.data(), piece.size(), 0};
        const std::size_t status = ZSTD_decompressStream(stream.get(), &out, &in);
        if (ZSTD_isError(status)) return failAt(error, "Zstandard", in.pos, ZSTD_getErrorName(status));
        if (!output.append({piece.data(), out.pos}, error)) return false;
        const bool allRead = in.pos == in.size;
        if (allRead && status == 0) return true;
        if (allRead && out.pos < out.size) return failAt(error, "Zstandard", in.pos, "cut short");
    }
}

}  // namespace

std::optional<std::vector<std::uint8_t>> decompress(Bytes bytes, Error* error) {
    if (bytes.size() > kLargestDecompressed) {
        fail(error, kErrorTooLarge, fmt::format("{} bytes of compressed data", bytes.size()));
        return std::nullopt;
    }
    BoundedOutput output(bytes.size());
    bool done = false;
    if (beginsLikeGzip(bytes) || beginsLikeZlib(bytes)) {
        done = inflateAll(bytes, output, error);
    } else if (beginsLikeZstandard(bytes)) {
        done = decodeZstandard(bytes, output, error);
    } else {
        fail(error, kErrorMalformed, "neither gzip nor zlib nor Zstandard data");
    }
    if (!done) return std::nullopt;
    return output.take();
}

}  // namespace qvct
