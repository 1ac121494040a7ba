#pragma once

#include <string>
#include <string_view>

#include <zlib.h>

namespace qvct::test {

/// As zlib writes it; a gzip member with 16 more window bits.
inline std::string deflated(std::string_view plain, int windowBits) {
    z_stream stream{};
    deflateInit2(&stream, 9, Z_DEFLATED, windowBits, 8, Z_DEFAULT_STRATEGY);
    std::string out(deflateBound(&stream, plain.size()) + 32, '\0');
    stream.next_in = reinterpret_cast<Bytef*>(const_cast<char*>(plain.data()));
    stream.avail_in = static_cast<uInt>(plain.size());
    stream.next_out = reinterpret_cast<Bytef*>(out.data());
    stream.avail_out = static_cast<uInt>(out.size());
    deflate(&stream, Z_FINISH);
    out.resize(stream.total_out);
    deflateEnd(&stream);
    return out;
}

inline std::string gzipped(std::string_view plain) {
    return deflated(plain, 15 + 16);
}

}  // namespace qvct::test
