#include "demo/Library.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <map>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace qvct::demo {
namespace {

using test::TemporaryFolder;

/// Every file below a folder by its relative path.
std::map<std::string, std::string> contents(const TemporaryFolder& folder) {
    std::map<std::string, std::string> files;
    for (const std::string& path : test::filesBelow(folder.path())) {
        files[path.substr(folder.path().size())] = test::readAll(path);
    }
    return files;
}

struct Written {
    TemporaryFolder folder;
    std::vector<std::string> items = writeLibrary(folder.path());
};

const Written& library() {
    static const Written written;
    return written;
}

TEST(DemoLibrary, IsTheSameByteForByteOnEveryRun) {
    const TemporaryFolder again;
    EXPECT_EQ(writeLibrary(again.path()), library().items);
    const auto first = contents(library().folder);
    EXPECT_TRUE(first == contents(again)) << "the files of two runs differ";
    EXPECT_THAT(library().items, testing::SizeIs(testing::Gt(45U)));
}

TEST(DemoLibrary, WritesOverAnEarlierLibraryAndLeavesOtherFilesAlone) {
    const TemporaryFolder folder;
    folder.write("One Shots/Drums/Kick/Deep House Kick.wav", std::string(1 << 20, 'x'));
    folder.write("One Shots/mine.txt", "mine");
    writeLibrary(folder.path());
    auto files = contents(folder);
    EXPECT_EQ(files["/One Shots/mine.txt"], "mine");
    files.erase("/One Shots/mine.txt");
    EXPECT_TRUE(files == contents(library().folder));
}

TEST(DemoLibrary, NamesThePathThatItCannotWrite) {
    const TemporaryFolder folder;
    folder.write("Patches", "a file where a folder should be");
    try {
        writeLibrary(folder.path());
        FAIL() << "wrote below a file";
    } catch (const std::system_error& error) {
        EXPECT_THAT(error.what(), testing::HasSubstr(folder.path("Patches")));
    }
}

}  // namespace
}  // namespace qvct::demo
