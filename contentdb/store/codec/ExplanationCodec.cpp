#include "contentdb/store/codec/ExplanationCodec.h"

#include "autotagging/names/ItemNames.h"
#include "contentdb/store/codec/ItemCodec.h"
#include "contentdb/store/codec/ServiceNumbers.h"

#include <algorithm>
#include <cmath>
#include <optional>
#include <span>

namespace qvct::contentdb {
namespace {

constexpr std::uint64_t kSteps = 1000;
constexpr std::uint64_t kFromLength = 2, kKinds = 4;  // in the first number
constexpr std::uint64_t kMostBeats = 1'000'000;
constexpr std::string_view kRoot = "/";  // every folder's name counts here

std::uint64_t stepsOf(double confidence) {
    return static_cast<std::uint64_t>(std::lround(std::clamp(confidence, 0.0, 1.0) * double{kSteps}));
}

double confidenceOf(std::uint64_t steps) {
    return static_cast<double>(std::min(steps, kSteps)) / double{kSteps};
}

/// Where the evidence of a claim stands, in the lower two bits of the claim's first number.
enum class Form : std::uint8_t { nowhere, whereTheOneBeforeIs, inName, texts };
constexpr std::uint64_t kDoubted = 4;
constexpr std::uint64_t kServices = 8;

std::string shortened(const std::string& text) {
    constexpr std::size_t longest = 80;
    if (text.size() <= longest) return text;
    std::size_t end = longest;
    while (end > 0 && (static_cast<unsigned char>(text[end]) & 0xC0U) == 0x80) --end;
    return text.substr(0, end) + "...";
}

bool standsWith(const TagClaim& claim, const TagClaim& other) {
    return claim.distance == other.distance && claim.evidence.offset == other.evidence.offset &&
           claim.evidence.what == other.evidence.what && claim.evidence.where == other.evidence.where;
}

class ExplanationWriter {
  public:
    explicit ExplanationWriter(std::string_view path) : names_(std::string(path), kRoot) {}

    std::string write(const Explanation& explanation) {
        out_.number(static_cast<std::uint64_t>(explanation.kind) * kKinds +
                    (explanation.isTempoFromLength ? kFromLength : 0) + (explanation.isWhole ? 1 : 0));
        const auto& tempo = explanation.tempo;
        out_.number(tempo ? 1 + static_cast<std::uint64_t>(std::lround(*tempo * double{kSteps})) : 0);
        out_.number(explanation.beats ? 1 + static_cast<std::uint64_t>(*explanation.beats) : 0);
        out_.number(explanation.held.size());
        std::uint64_t last = kSteps;
        for (const Explanation::Held& held : explanation.held) {
            const std::uint64_t steps = std::min(stepsOf(held.confidence), last);
            out_.number(held.tagging);
            out_.number(last - steps);
            write(held.claims, steps, {});
            last = steps;
        }
        out_.number(explanation.dropped.size());
        for (const DroppedTag& dropped : explanation.dropped) {
            out_.text(dropped.label);
            out_.number(stepsOf(dropped.confidence));
            out_.text(dropped.reason);
            write(dropped.claims, stepsOf(dropped.confidence), dropped.reason);
        }
        return out_.take();
    }

  private:
    void write(const std::vector<TagClaim>& claims, std::uint64_t stepsOfTag, std::string_view reason) {
        out_.number(claims.size());
        const TagClaim* before = nullptr;
        for (const TagClaim& claim : claims) {
            const Form form = formOf(claim, before);
            const std::uint64_t doubt = claim.doubt.empty() ? 0 : kDoubted;
            out_.number(numberOfService(claim.service) * kServices + doubt +
                        static_cast<std::uint64_t>(form));
            writePlace(claim, form);
            const std::uint64_t steps = stepsOf(claim.confidence);
            out_.number(steps == stepsOfTag ? 0 : 1 + steps);
            if (doubt != 0) out_.text(claim.doubt == reason ? std::string_view() : claim.doubt);
            before = &claim;
        }
    }

    Form formOf(const TagClaim& claim, const TagClaim* before) const {
        const auto& [what, where, offset] = claim.evidence;
        if (before != nullptr && standsWith(claim, *before)) return Form::whereTheOneBeforeIs;
        if (what.empty() && where.empty() && claim.distance == 0) return Form::nowhere;
        const auto distance = static_cast<std::size_t>(claim.distance);
        const std::span<const std::string_view> names = names_.all();
        const bool isInName = distance < names.size() && names[distance] == where && offset <= where.size() &&
                              std::string_view(where).substr(offset).starts_with(what);
        return isInName ? Form::inName : Form::texts;
    }

    void writePlace(const TagClaim& claim, Form form) {
        if (form != Form::inName && form != Form::texts) return;
        const auto& [what, where, offset] = claim.evidence;
        out_.number(static_cast<std::uint64_t>(claim.distance));
        out_.number(offset);
        if (form == Form::inName) {
            out_.number(what.size());
        } else {
            out_.text(shortened(what));
            out_.text(shortened(where));
        }
    }

    ItemNames names_;
    ByteWriter out_;
};

class ExplanationReader {
  public:
    ExplanationReader(std::string_view bytes, std::string_view path)
        : in_(bytes), names_(std::string(path), kRoot) {}

    bool read(Explanation& explanation) {
        const std::uint64_t head = in_.number();
        explanation.isWhole = head % kFromLength != 0;
        explanation.isTempoFromLength = head % kKinds >= kFromLength;
        explanation.kind = static_cast<SoundKind>(head / kKinds);
        const std::uint64_t tempo = in_.number();
        if (tempo > 0) explanation.tempo = static_cast<double>(tempo - 1) / double{kSteps};
        const std::uint64_t beats = in_.number();
        if (beats > 0) explanation.beats = static_cast<int>(std::min(beats - 1, kMostBeats));
        std::uint64_t steps = kSteps;
        for (std::size_t left = in_.count(); left > 0; --left) {
            Explanation::Held& held = explanation.held.emplace_back();
            held.tagging = in_.number();
            steps -= std::min(in_.number(), steps);
            held.confidence = confidenceOf(steps);
            held.claims = readClaims(steps, {}, {});
        }
        for (std::size_t left = in_.count(); left > 0; --left) {
            DroppedTag& dropped = explanation.dropped.emplace_back();
            dropped.label = in_.text();
            const std::uint64_t stepsOfTag = in_.number();
            dropped.confidence = confidenceOf(stepsOfTag);
            dropped.reason = in_.text();
            dropped.claims = readClaims(stepsOfTag, dropped.label, dropped.reason);
        }
        return head / kKinds <= static_cast<std::uint64_t>(SoundKind::oneShot) && in_.isIntact() &&
               in_.isAtEnd();
    }

  private:
    std::vector<TagClaim> readClaims(std::uint64_t stepsOfTag, const std::string& label,
                                     const std::string& reason) {
        std::vector<TagClaim> claims;
        for (std::size_t left = in_.count(); left > 0 && in_.isIntact(); --left) {
            TagClaim claim;
            const std::uint64_t head = in_.number();
            claim.label = label;
            claim.service = serviceOfNumber(head / kServices);
            readPlace(claim, static_cast<Form>(head % kDoubted), claims);
            const std::uint64_t steps = in_.number();
            claim.confidence = confidenceOf(steps == 0 ? stepsOfTag : steps - 1);
            if ((head & kDoubted) != 0) claim.doubt = in_.text();
            if ((head & kDoubted) != 0 && claim.doubt.empty()) claim.doubt = reason;
            claims.push_back(std::move(claim));
        }
        return claims;
    }

    void readPlace(TagClaim& claim, Form form, const std::vector<TagClaim>& before) {
        if (form == Form::whereTheOneBeforeIs && !before.empty()) {
            claim.evidence = before.back().evidence;
            claim.distance = before.back().distance;
        }
        if (form != Form::inName && form != Form::texts) return;
        const std::uint64_t distance = in_.number();
        claim.distance = static_cast<int>(distance);
        claim.evidence.offset = static_cast<std::uint32_t>(in_.number());
        if (form == Form::texts) {
            claim.evidence.what = in_.text();
            claim.evidence.where = in_.text();
            return;
        }
        const std::uint64_t size = in_.number();
        if (distance >= names_.all().size()) return;
        const std::string_view name = names_.all()[distance];
        claim.evidence.where = name;
        if (claim.evidence.offset <= name.size())
            claim.evidence.what = name.substr(claim.evidence.offset, size);
    }

    ByteReader in_;
    ItemNames names_;
};

}  // namespace

std::string encodedExplanation(const Explanation& explanation, std::string_view path) {
    return ExplanationWriter(path).write(explanation);
}

bool decodeExplanation(std::string_view bytes, std::string_view path, Explanation& explanation) {
    explanation = {};
    return ExplanationReader(bytes, path).read(explanation);
}

}  // namespace qvct::contentdb
