// Real property lists: what is valid survives a read and a write, what is hostile takes neither time nor
// memory.

#include "platform/data/PropertyListFile.h"
#include "support/Corpus.h"

#include <chrono>
#include <set>

#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

namespace qvct {
namespace {

using test::filesBelow;

/// What a process of its own found out about one file.
struct Reading {
    bool read = false;
    bool endedWell = false;
    std::chrono::duration<double> seconds{};
};

constexpr int kStatusRead = 0;
constexpr int kStatusRefused = 1;
constexpr int kStatusTooMuchMemory = 2;

long peakKibibytes() {
    rusage usage{};
    ::getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

/// Reads in a child, so that its peak of memory is its own and a crash is only its own.
Reading readInChild(const std::string& file, long mostKibibytes) {
    const auto start = std::chrono::steady_clock::now();
    const pid_t child = ::fork();
    if (child == 0) {
        const long before = peakKibibytes();
        const bool read = readPropertyListFile(file).has_value();
        const bool tooMuch = peakKibibytes() - before > mostKibibytes;
        ::_exit(tooMuch ? kStatusTooMuchMemory : read ? kStatusRead : kStatusRefused);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    const int code = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    return {code == kStatusRead, code == kStatusRead || code == kStatusRefused,
            std::chrono::steady_clock::now() - start};
}

/// Files that lie among the others for having once broken a reader, or for being no property lists.
bool isSoundAllTheSame(const std::string& file) {
    return file.ends_with("crash-348c909a0b3532977185f551eb5d2ed04e694883");
}
bool isUnsoundAllTheSame(const std::string& file) {
    return file.ends_with("/amp.plist") || file.ends_with("/invalid_tag.plist") ||
           file.ends_with("/malformed_dict.bplist") || file.ends_with("/recursion.bplist");
}

TEST(PropertyListCorpus, HostileListsAreRefusedInTimeAndMemory) {
    QVCT_SKIP_WITHOUT(test::corpus("plists"));
    constexpr long most = 64L * 1024;
    constexpr std::chrono::seconds longest{1};
    std::vector<std::string> files = filesBelow(test::corpus("plists/libplist/hostile-binary"));
    const auto xml = filesBelow(test::corpus("plists/libplist/hostile-xml"));
    files.insert(files.end(), xml.begin(), xml.end());
    for (const std::string& file : filesBelow(test::corpus("plists/cpython"))) {
        if (file.find("/valid_") == std::string::npos) files.push_back(file);
    }
    ASSERT_GT(files.size(), 70U);
    for (const std::string& file : files) {
        const Reading reading = readInChild(file, most);
        EXPECT_TRUE(reading.endedWell) << file << ": crashed, or took over 64 MiB";
        EXPECT_LT(reading.seconds, longest) << file;
        EXPECT_EQ(reading.read, isSoundAllTheSame(file)) << file;
    }
}

TEST(PropertyListCorpus, TheMeasureSeesMemory) {
    QVCT_SKIP_WITHOUT(test::corpus("plists"));
    EXPECT_FALSE(readInChild((test::corpus("plists/cpython") / "valid_xml.plist").string(), 1).endedWell);
}

std::vector<std::string> keysInOrder(const PropertyList& value) {
    std::vector<std::string> keys;
    if (const auto* items = value.array()) {
        for (const PropertyList& item : *items) {
            for (std::string& key : keysInOrder(item)) keys.push_back(std::move(key));
        }
    }
    if (const auto* entries = value.dictionary()) {
        for (const auto& [key, item] : *entries) {
            keys.push_back(key);
            for (std::string& below : keysInOrder(item)) keys.push_back(std::move(below));
        }
    }
    return keys;
}

TEST(PropertyListCorpus, ValidListsSurviveBothEncodings) {
    QVCT_SKIP_WITHOUT(test::corpus("plists"));
    std::vector<std::string> files = filesBelow(test::corpus("plists/libplist/valid"));
    for (const char* name : {"valid_xml.plist", "valid_binary.plist"}) {
        files.push_back((test::corpus("plists/cpython") / name).string());
    }
    for (const std::string& file : files) {
        Error error;
        const auto original = readPropertyListFile(file, &error);
        EXPECT_EQ(original.has_value(), !isUnsoundAllTheSame(file)) << error.message();
        if (!original) continue;
        for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
            const auto again = parsePropertyList(serializePropertyList(*original, format), &error);
            ASSERT_TRUE(again) << file << error.message();
            EXPECT_EQ(*again, *original) << file;
            EXPECT_EQ(keysInOrder(*again), keysInOrder(*original)) << file;
        }
    }
}

}  // namespace
}  // namespace qvct
