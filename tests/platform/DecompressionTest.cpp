#include "platform/base/bytes/BytesAsText.h"
#include "platform/files/reading/Decompression.h"
#include "support/Compressed.h"

#include <string>

#include <gtest/gtest.h>
#include <zstd.h>

namespace qvct {
namespace {

using Bytes = std::vector<std::uint8_t>;

Bytes bytesOf(std::string_view text) {
    return {text.begin(), text.end()};
}

Bytes gzip(const Bytes& plain) {
    return bytesOf(test::gzipped(textOf(plain)));
}

Bytes zlibStream(const Bytes& plain) {
    return bytesOf(test::deflated(textOf(plain), 15));
}

Bytes zstandard(const Bytes& plain) {
    Bytes out(ZSTD_compressBound(plain.size()));
    out.resize(ZSTD_compress(out.data(), out.size(), plain.data(), plain.size(), 3));
    return out;
}

/// Text that compresses to about a third.
Bytes ordinary(std::size_t size) {
    std::string text;
    for (unsigned i = 0; text.size() < size; ++i)
        text += std::to_string(i * 2654435761U) + "<Parameter name=";
    text.resize(size);
    return bytesOf(text);
}

Bytes joined(Bytes a, const Bytes& b) {
    a.insert(a.end(), b.begin(), b.end());
    return a;
}

TEST(Decompression, ReadsEachFormatWhateverTheSize) {
    for (const std::size_t size : {0U, 1U, 1000U, 65536U, 65537U, 1000000U}) {
        const Bytes plain = ordinary(size);
        for (const auto& compress : {gzip, zlibStream, zstandard}) {
            const auto result = decompress(compress(plain));
            ASSERT_TRUE(result.has_value()) << size;
            EXPECT_TRUE(*result == plain) << size;
        }
    }
}

TEST(Decompression, ReadsMembersAndFramesThatFollowEachOther) {
    const Bytes a = ordinary(70000), b = bytesOf("tail");
    for (const auto& compress : {gzip, zstandard}) {
        const auto result = decompress(joined(compress(a), compress(b)));
        ASSERT_TRUE(result.has_value());
        EXPECT_TRUE(*result == joined(a, b));
    }
}

TEST(Decompression, NoPartOfDamagedDataIsReturned) {
    const Bytes plain = ordinary(200000);
    for (const auto& compress : {gzip, zlibStream, zstandard}) {
        const Bytes whole = compress(plain);
        for (const std::size_t length : {std::size_t{3}, whole.size() / 2, whole.size() - 1}) {
            Error error;
            EXPECT_FALSE(decompress(std::span(whole).first(length), &error)) << length;
            EXPECT_EQ(error.code, kErrorMalformed);
        }
        EXPECT_FALSE(decompress(joined(whole, bytesOf("garbage"))));
    }
    Bytes flipped = gzip(plain);
    flipped[flipped.size() / 2] ^= 0xff;
    EXPECT_FALSE(decompress(flipped));
    const std::string neither = "neither gzip nor zlib nor Zstandard data";
    const std::pair<const char*, std::string> cases[] = {{"", neither},
                                                         {"x", neither},
                                                         {"<?xml version=\"1.0\"?>", neither},
                                                         {"\x1f, which begins gzip data", neither},
                                                         {"\x1f\x8b", "deflated data, byte 2: cut short"}};
    for (const auto& [text, reason] : cases) {
        Error error;
        EXPECT_FALSE(decompress(bytesOf(text), &error)) << text;
        EXPECT_EQ(error.message(), reason) << text;
    }
}

TEST(Decompression, StopsAtAThousandTimesTheInput) {
    const Bytes zeros(20'000'000, 0);
    for (const auto& compress : {gzip, zstandard}) {
        const Bytes bomb = compress(zeros);
        ASSERT_LT(bomb.size() * kHighestCompressionRatio, zeros.size() + 20'000'000);
        if (bomb.size() * kHighestCompressionRatio >= zeros.size()) continue;
        Error error;
        EXPECT_FALSE(decompress(bomb, &error));
        EXPECT_EQ(error.code, kErrorTooLarge);
    }
    EXPECT_LT(zstandard(zeros).size() * kHighestCompressionRatio, zeros.size());  // one bomb at least was one
}

TEST(Decompression, StopsAtTheLargestSize) {
    Bytes many;
    const Bytes member = gzip(Bytes(4 << 20, 'x'));
    const Bytes padding = gzip(ordinary(1 << 16));  // keeps the ratio below its bound
    for (int i = 0; i < 66; ++i) many = joined(joined(std::move(many), member), padding);
    Error error;
    EXPECT_FALSE(decompress(many, &error));
    EXPECT_EQ(error.code, kErrorTooLarge);
}

}  // namespace
}  // namespace qvct
