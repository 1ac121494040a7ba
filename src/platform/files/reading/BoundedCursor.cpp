#include "platform/files/reading/BoundedCursor.h"

#include <cstring>

namespace qvct {

const std::uint8_t* ReadWindow::Buffer::find(std::uint64_t offset, std::size_t count) const {
    if (offset < start || offset - start > filled || count > filled - (offset - start)) return nullptr;
    return bytes.data() + (offset - start);
}

const std::uint8_t* ReadWindow::at(std::uint64_t offset, std::size_t count) {
    if (offset > size_ || count > size_ - offset || count > kSize) return nullptr;
    if (const std::uint8_t* found = head_.find(offset, count)) return found;
    if (const std::uint8_t* found = other_.find(offset, count)) return found;
    const bool isHead = offset + count <= kSize;
    Buffer& buffer = isHead ? head_ : other_;
    buffer.start = isHead ? 0 : offset;
    const std::size_t wanted = std::min<std::uint64_t>(kSize, size_ - buffer.start);
    buffer.filled = reader_.read(buffer.start, std::span(buffer.bytes).first(wanted)) ? wanted : 0;
    return buffer.find(offset, count);
}

bool ReadWindow::copy(std::uint64_t offset, std::span<std::uint8_t> into) {
    if (into.size() > kSize) return reader_.read(offset, into);
    const std::uint8_t* bytes = at(offset, into.size());
    if (bytes != nullptr && !into.empty()) std::memcpy(into.data(), bytes, into.size());
    return bytes != nullptr;
}

bool BoundedCursor::take(std::uint64_t count) {
    failed_ = failed_ || count > end_ - position_;
    return !failed_;
}

std::uint64_t BoundedCursor::number(std::size_t width, ByteOrder order) {
    const std::uint8_t* bytes = take(width) ? window_->at(position_, width) : nullptr;
    failed_ = bytes == nullptr;
    if (failed_) return 0;
    position_ += width;
    return numberOf({bytes, width}, order);
}

void BoundedCursor::skip(std::uint64_t count) {
    if (take(count)) position_ += count;
}

std::vector<std::uint8_t> BoundedCursor::bytes(std::uint64_t count) {
    if (!take(count)) return {};
    std::vector<std::uint8_t> result(count);
    failed_ = !window_->copy(position_, result);
    if (failed_) return {};
    position_ += count;
    return result;
}

std::string BoundedCursor::text(std::uint64_t count) {
    const std::vector<std::uint8_t> characters = bytes(count);
    return {characters.begin(), characters.end()};
}

BoundedCursor BoundedCursor::part(std::uint64_t count) {
    BoundedCursor result = *this;
    skip(count);
    result.failed_ = failed_;
    result.end_ = failed_ ? result.position_ : position_;
    return result;
}

}  // namespace qvct
