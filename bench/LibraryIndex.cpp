// A library of many small files, from its first indexing to searches in it: rates and times, each beside the
// bare work that it is measured against.
//
//   bench_library index [FILES [FOLDER]]    makes a library, indexes it, and again beside a bare walk
//   bench_library search [ITEMS [FOLDER]]   fills a database, searches it beside SQLite's own text index
//   bench_library                           both
//
// 100,000 files or items unless told. All is made in a new folder within FOLDER, or else within that for
// temporary files, and removed at the end.

#include "Measure.h"
#include "contentdb/ContentDatabase.h"
#include "contentdb/store/StoreWriter.h"
#include "contentdb/terms/Terms.h"
#include "contentdb/terms/Words.h"
#include "platform/text/Text.h"
#include "support/AudioFixtures.h"
#include "support/ItemGenerator.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <string_view>
#include <vector>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

namespace {

using namespace qvct;
using namespace qvct::contentdb;
namespace fs = std::filesystem;

template <typename Work>
double clockMedian(Work work) {
    return bench::medianSeconds(work, 5, bench::clockTime);
}

void touch(const std::string& path, std::string_view bytes) {
    const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    if (file < 0 || ::write(file, bytes.data(), bytes.size()) < 0) {
        fmt::print(stderr, "{}: cannot be written\n", path);
        std::exit(1);
    }
    ::close(file);
}

constexpr std::size_t kChanges = 1000;

/// A loop as another maker's editor writes it, or a one shot; cut to a few milliseconds.
std::string sound(test::ItemGenerator& generator) {
    const test::Wav wav;
    const std::string music =
        generator.pick(3) == 0 ? wav.acid(2, 48 + static_cast<unsigned>(generator.pick(12)), 8, 120) : "";
    return wav.file(wav.format() + music + wav.data(200 + 2 * generator.pick(100)));
}

/// Folders of 200 files each, as packs have them; names by the generator. The paths of those to be changed.
std::vector<std::string> makeLibrary(const std::string& folder, std::size_t count) {
    constexpr std::size_t filesPerFolder = 200;
    test::ItemGenerator generator(1);
    std::vector<std::string> paths;
    std::string current;
    for (std::size_t i = 0; i < count; ++i) {
        if (i % filesPerFolder == 0) {
            current = fmt::format("{}/{:02} {}/{} {}", folder, i / filesPerFolder % 50, "Pack",
                                  generator.word(), i / filesPerFolder);
            fs::create_directories(current);
        }
        const std::string path = fmt::format("{}/{}_{}_{}bpm {:07}.wav", current, generator.word(),
                                             generator.word(), 60 + generator.pick(120), i);
        touch(path, sound(generator));
        if (i % std::max<std::size_t>(1, count / kChanges) == 0) paths.push_back(path);
    }
    return paths;
}

std::string command(const std::string& text) {
    return std::system(text.c_str()) == 0 ? std::string() : "failed: " + text;
}

IndexProgress index(const std::string& folder, const std::string& database) {
    IndexOptions options;
    options.folders = {folder};
    options.database = database;
    options.services = QVCTAutoTaggingOptionFilenameKeywords;
    options.worker.path = QVCT_INDEX_WORKER;
    Error error;
    const auto progress = indexLibrary(options, &error);
    if (!progress) {
        fmt::print(stderr, "{}\n", error.message());
        std::exit(1);
    }
    return *progress;
}

/// The least that reading a library costs: its folders listed, the beginning of each file read.
void readHeaders(const std::string& folder) {
    char bytes[4096];
    for (const fs::directory_entry& entry : fs::recursive_directory_iterator(folder)) {
        if (!entry.is_regular_file()) continue;
        const int file = ::open(entry.path().c_str(), O_RDONLY | O_CLOEXEC);
        bench::keep(::read(file, bytes, sizeof bytes));
        ::close(file);
    }
}

double megabytesAtMost(int who) {
    rusage usage{};
    ::getrusage(who, &usage);
    return static_cast<double>(usage.ru_maxrss) / 1024;
}

void benchIndex(std::size_t count, const std::string& folder) {
    const std::string library = folder + "/library";
    const std::string database = folder + "/library.db";
    const std::vector<std::string> paths = makeLibrary(library, count);
    command("sync");
    const auto items = static_cast<double>(count);
    const double bareRead = bench::secondsOf([&] { readHeaders(library); }, bench::processorTime);
    bench::printRow(fmt::format("headers of {} files read alone, processor time", count),
                    fmt::format("{:.1f} us each", bareRead * 1e6 / items), "");
    IndexProgress progress;
    double first = 0;
    const double ofProcessor =
        bench::secondsOf([&] { first = bench::secondsOf([&] { progress = index(library, database); }); },
                         bench::processorTime);
    bench::printRow(
        fmt::format("{} files indexed ({} processors)", progress.described, ::sysconf(_SC_NPROCESSORS_ONLN)),
        fmt::format("{:.1f} s, {:.0f}/s", first, items / first), "15,000/s on 2");
    bench::printRow(
        "  processor time; what two free processors can do",
        fmt::format("{:.1f} us each; {:.0f}/s", ofProcessor * 1e6 / items, 2 * items / ofProcessor),
        "15,000/s on 2");
    touch(folder + "/mark", {});
    const double bare = clockMedian([&] {
        bench::keep(command(fmt::format("find '{}' -newer '{}' > /dev/null", library, folder + "/mark")));
    });
    const double again = clockMedian([&] { progress = index(library, database); });
    bench::printRow("  walk with a look at every file (find -newer)", fmt::format("{:.3f} s", bare), "");
    bench::printRow(fmt::format("  indexed again, {} read", progress.described),
                    fmt::format("{:.3f} s", again), "");
    bench::printRow("  ratio", fmt::format("{:.2f}", again / bare), "at most 1.5");
    test::ItemGenerator generator(2);
    for (const std::string& path : paths) touch(path, sound(generator));
    ::usleep(50000);
    const double changed = bench::secondsOf([&] { progress = index(library, database); });
    bench::printRow(fmt::format("  {} changes", progress.described),
                    fmt::format("{:.2f} s more, {:.2f} ms each", changed - again,
                                (changed - again) * 1e3 / static_cast<double>(paths.size())),
                    "in proportion");
    bench::printRow(
        "  memory of the run; of one worker",
        fmt::format("{:.0f} MB; {:.0f} MB", megabytesAtMost(RUSAGE_SELF), megabytesAtMost(RUSAGE_CHILDREN)),
        "300 MB");
    bench::printRow("  database",
                    fmt::format("{:.0f} MB", static_cast<double>(fs::file_size(database)) / 1e6), "");
}

void fill(const std::string& path, std::size_t count) {
    const auto connection = openDatabase(path, Access::write);
    StoreWriter writer(*connection);
    test::ItemGenerator generator(1);
    constexpr std::size_t batch = 8192;
    for (std::size_t i = 0; i < count; i += batch) {
        writer.begin();
        for (std::size_t at = i; at < std::min(count, i + batch); ++at) {
            const IndexedItem item = generator.next(at + 1);
            writer.put(static_cast<ItemId>(at + 1), item, termsOf(item));
        }
        writer.commit();
    }
}

/// The same words, tags and tempos in a table of SQLite's text index, with prefixes: the baseline.
class TextIndex {
  public:
    TextIndex(const std::string& path, std::size_t count)
        : connection_(emptyFile(path), Connection::Mode::readWrite) {
        connection_.run(
            "PRAGMA page_size = 8192; PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL;"
            "CREATE VIRTUAL TABLE text USING fts5 (words, content = '', detail = none, "
            "tokenize = 'ascii', prefix = '1 2 3')");
        Statement insert(connection_, "INSERT INTO text (rowid, words) VALUES (?, CAST(? AS TEXT))");
        test::ItemGenerator generator(1);
        connection_.run("BEGIN");
        for (std::size_t i = 1; i <= count; ++i) {
            const std::string text = textOf(generator.next(i));
            insert.bind(1, static_cast<std::int64_t>(i)).bind(2, text).execute();
            if (i % 8192 == 0) connection_.run("COMMIT; BEGIN");
        }
        connection_.run("COMMIT");
    }

    std::size_t count(const std::string& word, const std::string& tag, int low, int high) {
        std::string match = fmt::format("\"{}\"* AND \"\xc2\x80tag{}\" AND (", folded(word), bareName(tag));
        for (int tempo = low; tempo <= high; ++tempo)
            match += fmt::format("{}\"\xc2\x80tempo{}\"", tempo == low ? "" : " OR ", tempo);
        match += ")";
        Statement statement(connection_, "SELECT rowid FROM text WHERE text MATCH CAST(? AS TEXT) LIMIT 50");
        std::size_t found = 0;
        for (statement.bind(1, match); statement.step();) ++found;
        return found;
    }

  private:
    static std::string emptyFile(const std::string& path) {
        std::ofstream(path).flush();
        return path;
    }

    static std::string textOf(const IndexedItem& item) {
        std::string text;
        for (const std::string_view part : textsOf(item)) {
            for (const std::string& word : wordsOf(part)) text += word + " ";
        }
        for (const IndexedTagging& tagging : item.taggings) {
            text += "\xc2\x80tag" + bareName(tagging.label) + " ";
            for (const std::string& ancestor : tagging.ancestors)
                text += "\xc2\x80tag" + bareName(ancestor) + " ";
        }
        for (const auto& [field, value] : numbersOf(item)) {
            if (field == "tempo") text += fmt::format("\xc2\x80tempo{:.0f} ", value);
        }
        return text;
    }

    Connection connection_;
};

struct Wanted {
    std::string word;
    std::string tag;
    int low;
};

std::vector<Wanted> queries(std::size_t count) {
    test::ItemGenerator generator(99);
    std::vector<Wanted> result;
    for (std::size_t i = 0; i < count; ++i) {
        std::string word = generator.word();
        if (i % 2 == 0) word.resize(std::max<std::size_t>(2, word.size() / 2));
        result.push_back({wordsOf(word)[0], std::string(generator.tag().label),
                          60 + static_cast<int>(generator.pick(110))});
    }
    return result;
}

template <typename Run>
void printTimes(std::string_view what, const std::vector<Wanted>& wanted, std::string_view target, Run run) {
    std::vector<double> times;
    std::size_t full = 0;
    for (const Wanted& one : wanted) {
        std::size_t found = 0;
        times.push_back(bench::secondsOf([&] { found = run(one); }) * 1e3);
        if (found == 50) ++full;
    }
    std::sort(times.begin(), times.end());
    bench::printRow(
        fmt::format("  {} ({}% find 50)", what, full * 100 / wanted.size()),
        fmt::format("p50 {:.2f}, p99 {:.2f} ms", times[times.size() / 2], times[times.size() * 99 / 100]),
        target);
}

void benchSearch(std::size_t count, const std::string& path) {
    const double filling = bench::secondsOf([&] { fill(path, count); });
    bench::printRow(fmt::format("{} items stored by one process", count),
                    fmt::format("{:.0f} s, {:.0f}/s", filling, static_cast<double>(count) / filling), "");
    const auto database = ContentDatabase::open(path);
    const Vocabulary vocabulary = *database->vocabulary();
    const std::vector<Wanted> wanted = queries(1000);
    printTimes("word, tag and tempo, limit 50", wanted, "p99 under 10 ms", [&](const Wanted& one) {
        const auto query =
            parseQuery(fmt::format("{} tag:\"{}\" bpm:{}..{}", one.word, one.tag, one.low, one.low + 6),
                       vocabulary, nullptr);
        return database->search(*query, 50)->size();
    });
    const std::vector<Wanted> few(wanted.begin(), wanted.begin() + 20);
    printTimes("tags of the matches of a word", few, "", [&](const Wanted& one) {
        return database->facets(*parseQuery(one.word, vocabulary, nullptr))->size();
    });
    printTimes("similar items", few, "", [&](const Wanted& one) {
        const auto found = database->search(*parseQuery(one.word, vocabulary, nullptr), 1);
        return found->empty() ? 0 : database->similar(found->front().item.path, 50)->size();
    });
    TextIndex baseline(path + "-text", count);
    printTimes("the same words, tags and tempos in FTS5", wanted, "baseline",
               [&](const Wanted& one) { return baseline.count(one.word, one.tag, one.low, one.low + 6); });
}

}  // namespace

int main(int argc, char** argv) {
    const std::string_view what = argc > 1 ? argv[1] : "";
    const std::size_t count = argc > 2 ? std::strtoull(argv[2], nullptr, 10) : 100000;
    const fs::path parent = argc > 3 ? fs::path(argv[3]) : fs::temp_directory_path();
    std::string pattern = (parent / "qvct-bench-XXXXXX").string();
    if (::mkdtemp(pattern.data()) == nullptr) {
        fmt::print(stderr, "{}: {}\n", parent.string(), std::strerror(errno));
        return 1;
    }
    const std::string& folder = pattern;
    if (what == "" || what == "index") benchIndex(count, folder);
    if (what == "" || what == "search") benchSearch(count, folder + "/search.db");
    fs::remove_all(folder);
    return 0;
}
