#include "autotagging/names/NameScan.h"

#include "autotagging/names/NamePrefix.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <bit>

namespace qvct {
namespace {

using Pieces = std::span<const NamePiece>;
using Word = NamingHabits::Word;

constexpr std::string_view kPart = "Part";  // the category
constexpr double kSlowest = 40, kFastest = 250;

}  // namespace

NameScan::NameScan(const NamingHabits& habits, std::string_view name, Pieces pieces, Owner owner,
                   std::string& buffer)
    : habits_(habits), name_(name), pieces_(pieces), owner_(owner), buffer_(buffer) {
    for (std::size_t at = owner == Owner::item ? readPrefix() : 0; at < pieces_.size();) at += readAt(at);
}

/// "Fm" is a key where "FM" and "fm" are a way to make sounds, unless a tempo stands beside it: "fm_120bpm".
bool NameScan::isMinorKey(std::size_t at) const {
    const std::string_view text = pieces_[at].text;
    if (text.size() != 2 || text[1] != 'm') return false;
    if (text[0] >= 'A' && text[0] <= 'G') return true;
    return text == "fm" && (before_ == NameRole::tempo || isTempoWord(at + 1) || isTempoWord(at + 2));
}

/// "Fs1" is a note, where "fs" is a finger snap.
bool NameScan::isSharpNote(std::size_t at) const {
    const std::string_view text = pieces_[at].text;
    if (text.size() != 2 || text[0] < 'A' || text[0] > 'G' || text[1] != 's') return false;
    const std::size_t behind = at + 1;
    return behind < pieces_.size() && pieces_[behind].isNumber() && pieces_[behind].isJoined &&
           pieces_[behind].text.size() == 1;
}

/// The pieces that the code of a category takes, which stand for nothing else.
std::size_t NameScan::readPrefix() {
    const auto prefix = namePrefixOf(name_);
    if (!prefix) return 0;
    prefix_ = habits_.wordsOfPrefix(prefix->code);
    if (prefix_.empty()) return 0;
    const auto end = static_cast<std::uint32_t>(prefix->code.size());
    for (const Word& word : prefix_) meant_.push_back({word, 0, end, true});
    makers_ = prefix->makers;
    if (makers_.first < makers_.second) silences_.push_back(makers_);
    const auto behind = std::find_if(pieces_.begin(), pieces_.end(),
                                     [end](const NamePiece& piece) { return piece.offset >= end; });
    return static_cast<std::size_t>(behind - pieces_.begin());
}

std::size_t NameScan::readAt(std::size_t at) {
    const Pieces rest = pieces_.subspan(at);
    const Word word = habits_.wordAt(rest, buffer_);
    // "H-Moll", where a lone "H" is a hi-hat.
    const bool isLetterWord = word.pieces == 1 && rest.front().isLetter();
    const bool mayBeKey = word.pieces == 0 || isLetterWord || isSharpNote(at) ||
                          (isMinorKey(at) && word.role != NameRole::silent);
    const auto key = mayBeKey ? namedKeyAt(rest, habits_) : std::nullopt;
    if (key && (!isLetterWord || key->isSpelledOut)) return readKey(at, *key);
    if (word.pieces > 0) return readWord(at, word);
    const std::size_t read = rest.front().isNumber() ? readNumber(at) : readPacked(at);
    before_ = NameRole::none;
    return read;
}

std::size_t NameScan::readWord(std::size_t at, const Word& word) {
    const std::size_t behind = at + word.pieces;
    before_ = word.role;
    // "OS_Loop" may be somebody's.
    const bool mayBeInitials =
        at == 0 && word.pieces == 1 && pieces_[0].text.size() <= 2 && pieces_.size() > 1;
    if (!mayBeInitials) noteKind(word.role);
    // "drum loop" and "drumloop" are words, and say that it is a loop.
    for (const NamePiece& piece : pieces_.subspan(at, word.pieces)) noteKindInside(piece);
    const std::uint32_t offset = pieces_[at].offset, end = pieces_[behind - 1].end();
    addMeant(word, offset, end);
    if (word.pieces > 1) addWordsIn(word, pieces_.subspan(at, word.pieces));
    if (word.role == NameRole::silent) silences_.emplace_back(offset, end);
    if (word.role == NameRole::tempo && !tempos_.empty() && tempos_.back().end == at) {
        tempos_.back().isSaid = true;
        behindTempo_ = behind;
    }
    const bool isUnit =
        word.role == NameRole::unit || word.role == NameRole::bars || word.role == NameRole::beats;
    const bool isOfNumber = isUnit && at > 0 && behindNumber_ == at;
    if (isOfNumber) noteUnit(at, word.role);
    // A layer has a word behind what it is one of; "MF_Bass" may be a maker.
    const bool isLayer = word.role == NameRole::layer && at > 0;
    isLayer_ = isLayer_ || isLayer;
    isOfPack_ = isOfPack_ || word.role == NameRole::pack;
    // "Vol 2", "Take C", "Bar 3": what is counted is neither a tempo nor a note; but "Your Type 165bpm".
    const bool isCounted = (word.role == NameRole::count || isLayer || (isUnit && !isOfNumber)) &&
                           behind < pieces_.size() && !isTempoWord(behind + 1) &&
                           (pieces_[behind].isNumber() || pieces_[behind].isLetter());
    return word.pieces + (isCounted ? 1U : 0U);
}

bool NameScan::isTempoWord(std::size_t at) const {
    return at < pieces_.size() && habits_.roleOf(pieces_[at].folded) == NameRole::tempo;
}

void NameScan::noteKindInside(const NamePiece& piece) {
    constexpr std::size_t shortest = 4, longest = 12;
    const std::size_t size = piece.folded.size();
    for (std::size_t at = size - std::min(size, longest); at + shortest <= size; ++at) {
        if (at == 1) continue;  // "bloop"
        const NameRole role = habits_.roleOf(piece.folded.substr(at));
        if (role == NameRole::loop || (at == 0 && role == NameRole::oneShot)) noteKind(role);
    }
}

void NameScan::noteKind(NameRole role) {
    saysLoop_ = saysLoop_ || role == NameRole::loop;
    saysOneShot_ = saysOneShot_ || role == NameRole::oneShot;
}

/// "4 bars", "16beats", "64 steps", "96 kHz": the number before it is no tempo.
void NameScan::noteUnit(std::size_t at, NameRole role) {
    constexpr int most = 64;
    if (!tempos_.empty() && tempos_.back().end == at) tempos_.pop_back();
    const auto number = static_cast<int>(numberAt(pieces_.subspan(at - 1, 1), name_).value_or(0));
    // The beats of an "SP12" are not twelve.
    const bool isPartOfWord = pieces_[at - 1].isJoined && !pieces_[at].isJoined;
    if (number < 1 || number > most || isPartOfWord) return;
    if (role == NameRole::bars) bars_ = number;
    // Music has beats by twos and threes; "Top 40 Beats" are none.
    const int rest = number >> std::countr_zero(static_cast<unsigned>(number));
    if (role == NameRole::beats && (rest == 1 || rest == 3)) beats_ = number;
}

bool NameScan::isOfMaker(std::uint32_t offset) const {
    return offset >= makers_.first && offset < makers_.second;
}

void NameScan::addMeant(const Word& word, std::uint32_t offset, std::uint32_t end) {
    if (isOfMaker(offset)) return;
    // A letter stands for a word only where a name begins with it: "K_01".
    if (end - offset == 1 && offset != pieces_.front().offset) return;
    if (word.meaning != Word::kNoMeaning) meant_.push_back({word, offset, end});
    for (std::uint32_t at = word.other; at != Word::kNoMeaning; at = habits_.other(at).other)
        meant_.push_back({habits_.other(at), offset, end});
}

/// "Drum Fill" is a fill, and of drums; but there is no bass in "Drum and Bass", and no genre in "Jazz
/// Guitar".
void NameScan::addWordsIn(const Word& phrase, std::span<const NamePiece> pieces) {
    if (phrase.meaning == Word::kNoMeaning || isOfMaker(pieces.front().offset)) return;
    const std::string& category = habits_.meaning(phrase.meaning).category;
    if (category == QVCategoryGenresIdentifier) return;
    for (std::size_t i = 0; i < pieces.size(); ++i) {
        const Word word = habits_.wordAt(pieces.subspan(i, 1), buffer_);
        if (word.meaning == Word::kNoMeaning || pieces[i].text.size() == 1) continue;
        const std::string& its = habits_.meaning(word.meaning).category;
        if (its != category && its != QVCategoryGenresIdentifier)
            meant_.push_back({word, pieces[i].offset, pieces[i].end()});
    }
}

std::size_t NameScan::readKey(std::size_t at, const NamedKey& key) {
    // The fifth in "Cm7b5" is no note.
    const bool isNote = key.hasOctave && !pieces_[at].isJoined;
    hasNote_ = hasNote_ || isNote;
    beginsWithNote_ = beginsWithNote_ || (isNote && at == 0);
    // "Pad D", "Drone in D"
    const std::size_t front = at > 1 && pieces_[at - 1].folded == "in" ? at - 1 : at;
    const bool isBehindPitched =
        front > 0 && std::any_of(meant_.begin(), meant_.end(), [&](const Meant& meant) {
            return meant.end == pieces_[front - 1].end() && habits_.meaning(meant.word.meaning).isPitched;
        });
    if (!key.hasOctave)
        keys_.push_back({key, at, before_ == NameRole::key, isBehindPitched, isVariantAt(at, key)});
    before_ = NameRole::none;
    return key.pieces;
}

/// A letter beside a word for variants or strings tells which; beside the word for a wind instrument, how it
/// is tuned.
bool NameScan::isVariantAt(std::size_t at, const NamedKey& key) const {
    if (key.mode != NamedKey::Mode::unsaid || key.isSpelledOut) return false;
    const std::size_t behind = at + key.pieces;
    const Word next = behind < pieces_.size() ? habits_.wordAt(pieces_.subspan(behind), buffer_) : Word{};
    if (!key.hasAccidental && (before_ == NameRole::variant || next.role == NameRole::variant)) return true;
    const auto isTransposing = [this](const Word& word) {
        return word.meaning != Word::kNoMeaning && habits_.meaning(word.meaning).isTransposing;
    };
    if (isTransposing(next)) return true;
    return at > 1 && pieces_[at - 1].folded == "in" && !meant_.empty() &&
           meant_.back().end == pieces_[at - 2].end() && isTransposing(meant_.back().word);
}

/// "Am", but not the letter that belongs to a number.
bool NameScan::beginsWithMode(Pieces pieces) const {
    const auto key = pieces.front().isWord() ? namedKeyAt(pieces, habits_) : std::nullopt;
    return key && key->mode != NamedKey::Mode::unsaid;
}

std::size_t NameScan::readNumber(std::size_t at) {
    const auto number = numberAt(pieces_.subspan(at), name_);
    const bool isWhole = !number || *number == static_cast<int>(*number);
    const std::size_t read = isWhole ? 1 : 2;
    // What a pack's number counts is none of the sound: "Vol 2 Beats".
    if (before_ != NameRole::pack) behindNumber_ = at + read;
    if (!number || *number < kSlowest || *number > kFastest) return read;
    // Of "140bpm (89)" only the first is.
    const bool isSaid = before_ == NameRole::tempo && behindTempo_ != at;
    // "TR808", "v124": part of a word, but not of one in "Am120bpm", "120Am" and "Bassline120F#m".
    const Pieces rest = pieces_.subspan(at + read);
    const bool isJoinedOn = !rest.empty() && rest.front().isJoined;
    const bool isBeforeTempo = isTempoWord(at + read);
    const bool isBeforeKey = isJoinedOn && beginsWithMode(rest);
    const bool isPartOfWord = (pieces_[at].isJoined || isJoinedOn) && !isBeforeTempo && !isBeforeKey;
    tempos_.push_back({*number, isSaid, isPartOfWord && !isSaid, at + read});
    return read;
}

std::size_t NameScan::readPacked(std::size_t at) {
    noteKindInside(pieces_[at]);
    auto [first, second] = habits_.packedWords(pieces_[at].folded);
    if (first.pieces == 0) first = habits_.nearWord(pieces_[at]);
    constexpr std::size_t shortestWord = 3;
    if (first.pieces == 0 && pieces_[at].folded.size() >= shortestWord) ++unknownWords_;
    for (const Word& word : {first, second}) {
        if (word.pieces == 0) break;
        noteKind(word.role);
        addMeant(word, pieces_[at].offset, pieces_[at].end());
    }
    return 1;
}

std::optional<double> NameScan::tempo(SoundKind kind) const {
    if (tempos_.empty()) return std::nullopt;
    TempoContext context{name_, pieces_, keys_};
    context.isItem = owner_ == Owner::item;
    // "Drum Loops/MK_120_shade", and the folder in "Jungle/160/think loop"
    const bool isOfLoop = kind == SoundKind::loop && (context.isItem || pieces_.size() == 1);
    context.isLoop = isLoop() || isOfLoop;
    context.isOneShot = this->kind() == SoundKind::oneShot;
    context.isPassage = !context.isLoop && saysPassage();
    context.hasPitched = !keys_.empty() && saysPitched();
    return chosenTempo(tempos_, context);
}

std::vector<double> NameScan::possibleTempos() const {
    return kind() == SoundKind::oneShot ? std::vector<double>{} : lonelyTempos(tempos_);
}

std::optional<double> NameScan::tempoWith(const NameScan& folder) const {
    if (tempos_.empty() || folder.pieces_.size() != 1 || lonelyTempos(folder.tempos_).empty())
        return std::nullopt;
    const double number = folder.tempos_.front().number;
    const bool isHere = std::any_of(tempos_.begin(), tempos_.end(),
                                    [number](const ScannedTempo& tempo) { return tempo.number == number; });
    return isHere ? std::optional(number) : std::nullopt;
}

std::optional<NamedKey> NameScan::key(std::optional<double> tempo) const {
    if (keys_.empty()) return std::nullopt;
    KeyContext context{habits_, name_, pieces_};
    context.tempo = tempo;
    context.isFolder = owner_ == Owner::folder;
    context.isLoop = isLoop();
    context.isLayer = isLayer_;
    context.hasNote = hasNote_;
    context.beginsWithNote = beginsWithNote_;
    context.hasMeaning = !meant_.empty();
    context.hasPitched = saysPitched();
    context.hasNumber = std::any_of(tempos_.begin(), tempos_.end(),
                                    [](const ScannedTempo& its) { return !its.isPartOfWord; });
    return chosenKey(keys_, context);
}

bool NameScan::saysPassage() const {
    return std::any_of(meant_.begin(), meant_.end(), [&](const Meant& meant) {
        const NamedMeaning& meaning = habits_.meaning(meant.word.meaning);
        return meaning.category == kPart && meaning.isPitched;
    });
}

bool NameScan::saysPitched() const {
    return std::any_of(meant_.begin(), meant_.end(),
                       [&](const Meant& meant) { return habits_.meaning(meant.word.meaning).isPitched; });
}

}  // namespace qvct
