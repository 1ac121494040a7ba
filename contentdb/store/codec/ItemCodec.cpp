#include "contentdb/store/codec/ItemCodec.h"

#include "contentdb/store/StampNumbers.h"
#include "contentdb/store/codec/ExplanationCodec.h"
#include "contentdb/store/codec/ServiceNumbers.h"

#include <bit>
#include <cstring>

namespace qvct::contentdb {
namespace {

static_assert(std::endian::native == std::endian::little, "the file has its numbers in this order");

void write(ByteWriter& out, const IndexedTagging& tagging) {
    out.text(tagging.label);
    out.text(tagging.category);
    out.number(tagging.ancestors.size());
    for (const std::string& ancestor : tagging.ancestors) out.text(ancestor);
    out.number(tagging.level ? 1 : 0);
    if (tagging.level) out.number(std::bit_cast<std::uint32_t>(*tagging.level));
    out.number(static_cast<std::uint64_t>(tagging.provenance));
    // Its number takes less room, and is a character that no name is made of.
    const std::size_t number = numberOfService(tagging.service);
    out.text(number == 0 ? tagging.service : std::string(1, static_cast<char>(number)));
    out.number(tagging.isAuto ? 1 : 0);
}

/// Stands before an explanation. Earlier editions have here, of every tagging, 0 or one more than its
/// confidence in thousandths, and then the evidence; no tag holds with a confidence of 0.
constexpr std::uint64_t kExplanationFollows = 1;

/// What those editions kept, in the form of today.
std::string explanationOfEarlierEdition(ByteReader& in, std::uint64_t steps, const IndexedItem& item) {
    constexpr double kSteps = 1000;
    Explanation explanation;
    for (std::size_t i = 0; i < item.taggings.size(); ++i) {
        if (i > 0) steps = in.number();
        if (steps == 0) continue;
        Explanation::Held& held = explanation.held.emplace_back();
        held.tagging = i;
        held.confidence = static_cast<double>(steps - 1) / kSteps;
        TagClaim claim;
        claim.service = serviceOfNumber(numberOfService(item.taggings[i].service));
        claim.confidence = held.confidence;
        claim.evidence.what = in.text();
        if (!item.taggings[i].service.empty()) held.claims.push_back(std::move(claim));
    }
    return encodedExplanation(explanation, {});
}

IndexedTagging readTagging(ByteReader& in) {
    IndexedTagging tagging;
    tagging.label = in.text();
    tagging.category = in.text();
    for (std::size_t left = in.count(); left > 0; --left) tagging.ancestors.emplace_back(in.text());
    if (in.number() != 0) tagging.level = std::bit_cast<float>(static_cast<std::uint32_t>(in.number()));
    tagging.provenance = static_cast<Provenance>(in.number());
    const std::string_view service = in.text();
    const std::size_t number = service.size() == 1 ? static_cast<unsigned char>(service[0]) : 0;
    tagging.service = number > 0 && number < ' ' ? serviceOfNumber(number) : service;
    tagging.isAuto = in.number() != 0;
    return tagging;
}

void write(ByteWriter& out, const IndexedValue& value) {
    out.text(value.key);
    const auto* number = std::get_if<double>(&value.value);
    out.number(number != nullptr ? 1 : 0);
    if (number != nullptr) {
        out.real(*number);
    } else {
        out.text(std::get<std::string>(value.value));
    }
}

IndexedValue readValue(ByteReader& in) {
    IndexedValue value;
    value.key = in.text();
    if (in.number() != 0) {
        value.value = in.real();
    } else {
        value.value = std::string(in.text());
    }
    return value;
}

}  // namespace

void ByteWriter::number(std::uint64_t value) {
    for (; value >= 0x80; value >>= 7U) bytes_ += static_cast<char>(value | 0x80U);
    bytes_ += static_cast<char>(value);
}

void ByteWriter::real(double value) {
    char raw[sizeof value];
    std::memcpy(raw, &value, sizeof value);
    bytes_.append(raw, sizeof value);
}

void ByteWriter::text(std::string_view value) {
    number(value.size());
    bytes_ += value;
}

void ByteWriter::stamp(const ItemStamp& value) {
    for (const std::uint64_t part : numbersOf(value)) number(part);
}

std::string_view ByteReader::take(std::size_t size) {
    if (size > rest_.size()) {
        isIntact_ = false;
        rest_ = {};
        return {};
    }
    const std::string_view taken = rest_.substr(0, size);
    rest_.remove_prefix(size);
    return taken;
}

std::uint64_t ByteReader::number() {
    std::uint64_t value = 0;
    for (unsigned shift = 0; shift < 64; shift += 7) {
        const std::string_view taken = take(1);
        if (taken.empty()) return 0;
        const auto byte = static_cast<unsigned char>(taken[0]);
        value |= static_cast<std::uint64_t>(byte & 0x7FU) << shift;
        if (byte < 0x80) return value;
    }
    isIntact_ = false;
    return 0;
}

double ByteReader::real() {
    double value = 0;
    const std::string_view raw = take(sizeof value);
    if (raw.size() == sizeof value) std::memcpy(&value, raw.data(), sizeof value);
    return value;
}

std::string_view ByteReader::text() {
    return take(count());
}

ItemStamp ByteReader::stamp() {
    StampNumbers parts{};
    for (std::uint64_t& part : parts) part = number();
    return stampOf(parts);
}

std::size_t ByteReader::count() {
    const std::uint64_t value = number();
    if (value <= rest_.size()) return static_cast<std::size_t>(value);
    isIntact_ = false;
    rest_ = {};
    return 0;
}

std::string encodedDescription(const IndexedItem& item) {
    ByteWriter out;
    out.text(item.name);
    out.number(static_cast<std::uint64_t>(item.fileType));
    out.number(static_cast<std::uint64_t>(item.subFileType));
    out.number(item.previewAvailable ? 1 : 0);
    out.number(item.taggings.size());
    for (const IndexedTagging& tagging : item.taggings) write(out, tagging);
    out.number(item.values.size());
    for (const IndexedValue& value : item.values) write(out, value);
    out.number(item.packs.size());
    for (const std::string& pack : item.packs) out.text(pack);
    out.number(item.dependencies.size());
    for (const IndexedDependency& dependency : item.dependencies) {
        out.text(dependency.uuid);
        out.text(dependency.path);
    }
    out.text(item.failure);
    const bool isHeard = !item.likeness.empty() || !item.fingerprint.empty();
    const bool isExplained = !item.explanation.empty() || isHeard;
    if (!item.title.empty() || isExplained) out.text(item.title);
    if (!isExplained) return out.take();
    out.number(kExplanationFollows);
    out.text(item.explanation);
    if (!isHeard) return out.take();
    out.text(item.likeness);
    out.text(item.fingerprint);
    return out.take();
}

bool decodeDescription(std::string_view bytes, IndexedItem& item) {
    ByteReader in(bytes);
    item.name = in.text();
    item.fileType = static_cast<std::int64_t>(in.number());
    item.subFileType = static_cast<std::int64_t>(in.number());
    item.previewAvailable = in.number() != 0;
    for (std::size_t left = in.count(); left > 0; --left) item.taggings.push_back(readTagging(in));
    for (std::size_t left = in.count(); left > 0; --left) item.values.push_back(readValue(in));
    for (std::size_t left = in.count(); left > 0; --left) item.packs.emplace_back(in.text());
    for (std::size_t left = in.count(); left > 0; --left) {
        IndexedDependency dependency;
        dependency.uuid = in.text();
        dependency.path = in.text();
        item.dependencies.push_back(std::move(dependency));
    }
    item.failure = in.text();
    if (!in.isAtEnd()) item.title = in.text();
    if (!in.isAtEnd()) {
        const std::uint64_t first = in.number();
        item.explanation = first == kExplanationFollows ? std::string(in.text())
                                                        : explanationOfEarlierEdition(in, first, item);
    }
    if (!in.isAtEnd()) {
        item.likeness = in.text();
        item.fingerprint = in.text();
    }
    return in.isIntact() && in.isAtEnd();
}

}  // namespace qvct::contentdb
