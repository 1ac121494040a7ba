#include "platform/FileAccess.h"
#include "platform/FileReplacement.h"
#include "support/AudioFixtures.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <csignal>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace qvct {
namespace {

using test::TemporaryFolder;
using testing::HasSubstr;

constexpr uid_t kNobody = 65534;

std::string contentsOf(const std::string& path) {
    const auto bytes = readFile(path);
    return bytes ? std::string(bytes->begin(), bytes->end()) : "unreadable";
}

struct stat statusOf(const std::string& path) {
    struct stat status {};
    ::lstat(path.c_str(), &status);
    return status;
}

std::size_t filesIn(const TemporaryFolder& folder) {
    return test::filesBelow(folder.path()).size();
}

TEST(FileReplacement, PutsPiecesTogetherAtAnyAlignment) {
    const std::string old = test::noise(50000);
    struct Range {
        std::uint64_t offset, length;
    };
    const std::vector<Range> lists[] = {{{0, 50000}},
                                        {{8, 49992}},
                                        {{4096, 8192}, {0, 1}, {12288, 30000}},
                                        {{1, 4095}, {4096, 45904}},
                                        {{49999, 1}}};
    for (const auto& ranges : lists) {
        for (const std::string& head : {std::string(), std::string("12345678"), std::string(4096, 'x')}) {
            const TemporaryFolder folder;
            const std::string path = folder.write("file", old);
            std::vector<FilePiece> pieces{{.bytes = head}};
            std::string expected = head;
            for (const Range& range : ranges) {
                pieces.push_back({.bytes = {}, .offset = range.offset, .length = range.length});
                expected += old.substr(range.offset, range.length);
            }
            Error error;
            ASSERT_TRUE(replaceFileByPieces(path, pieces, {}, &error)) << error.message;
            EXPECT_TRUE(contentsOf(path) == expected) << head.size() << " " << ranges.size();
        }
    }
}

TEST(FileReplacement, KeepsModeAttributesAndOnRequestTheTimes) {
    const TemporaryFolder folder;
    for (const bool keeps : {false, true}) {
        const std::string path = folder.write("file", "old");
        ::chmod(path.c_str(), 0640);
        const bool hasAttributes = ::setxattr(path.c_str(), "user.rating", "five", 4, 0) == 0;
        const struct timespec times[2] = {{1000, 1}, {2000, 2}};
        ::utimensat(AT_FDCWD, path.c_str(), times, 0);
        const FilePiece piece{.bytes = "new"};
        ASSERT_TRUE(
            replaceFileByPieces(path, {&piece, 1}, {.keepsTimes = keeps, .expected = {}, .check = {}}));
        const struct stat status = statusOf(path);
        EXPECT_EQ(status.st_mode & 07777U, 0640U);
        EXPECT_EQ(status.st_mtim.tv_sec == 2000 && status.st_mtim.tv_nsec == 2, keeps);
        EXPECT_EQ(status.st_atim.tv_sec == 1000, keeps);
        if (!hasAttributes) continue;
        char value[8] = {};
        EXPECT_EQ(::getxattr(path.c_str(), "user.rating", value, sizeof value), 4);
        EXPECT_STREQ(value, "five");
    }
}

TEST(FileReplacement, FollowsSymbolicLinksEvenIntoAnotherFileSystem) {
    const TemporaryFolder folder;
    char other[] = "/dev/shm/qvct-XXXXXX";
    const bool hasOther = ::mkdtemp(other) != nullptr;
    for (const std::string& target : {folder.path("target"), std::string(other) + "/target"}) {
        if (target.starts_with("/dev") && !hasOther) continue;
        std::ofstream(target) << "old";
        const std::string link = folder.path("link");
        std::filesystem::remove(link);
        std::filesystem::create_symlink(target, link);
        Error error;
        EXPECT_TRUE(replaceFile(link, "new", &error)) << error.message;
        EXPECT_TRUE(S_ISLNK(statusOf(link).st_mode));
        EXPECT_EQ(contentsOf(target), "new");
    }
    std::filesystem::remove_all(other);
    EXPECT_EQ(filesIn(folder), 1U) << "a temporary file was left behind";
}

TEST(FileReplacement, AnotherHardLinkKeepsTheOldContents) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    std::filesystem::create_hard_link(path, folder.path("backup"));
    EXPECT_TRUE(replaceFile(path, "new"));
    EXPECT_EQ(contentsOf(path), "new");
    EXPECT_EQ(contentsOf(folder.path("backup")), "old");
}

TEST(FileReplacement, RefusesProtectedFilesAndWhatIsNoFile) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    ::chmod(path.c_str(), 0444);
    Error error;
    EXPECT_FALSE(replaceFile(path, "new", &error));
    EXPECT_THAT(error.message, testing::AllOf(HasSubstr(path), HasSubstr("protected from writing")));
    EXPECT_EQ(contentsOf(path), "old");
    std::filesystem::create_directory(folder.path("folder"));
    EXPECT_FALSE(replaceFile(folder.path("folder"), "new", &error));
    EXPECT_FALSE(replaceFile(folder.path("missing/file"), "new", &error));
    EXPECT_EQ(filesIn(folder), 1U);
}

TEST(FileReplacement, AReadOnlyFolderIsAnErrorAndLosesNothing) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    ::chmod(path.c_str(), 0666);
    ::chmod(folder.path().c_str(), 0555);
    const bool isRoot = ::geteuid() == 0;
    ASSERT_EQ(isRoot ? ::seteuid(kNobody) : 0, 0);
    Error error;
    const bool replaced = replaceFile(path, "new", &error);
    ASSERT_EQ(isRoot ? ::seteuid(0) : 0, 0);
    ::chmod(folder.path().c_str(), 0755);
    EXPECT_FALSE(replaced);
    EXPECT_THAT(error.message, testing::AllOf(HasSubstr(path), HasSubstr("Permission denied")));
    EXPECT_EQ(contentsOf(path), "old");
}

TEST(FileReplacement, AFullDiskLosesNothingAndLeavesNothingBehind) {
    const TemporaryFolder folder;
    if (::mount("tmpfs", folder.path().c_str(), "tmpfs", 0, "size=64k") != 0) {
        GTEST_SKIP() << "no right to mount a small file system";
    }
    const std::string old(40000, 'o');
    const std::string path = folder.write("file", old);
    Error error;
    const bool replaced = replaceFile(path, std::string(60000, 'n'), &error);
    const FilePiece pieces[] = {{.bytes = {}, .offset = 1, .length = 39999}, {.bytes = "new"}};
    const bool replacedByRange = replaceFileByPieces(path, pieces, {}, nullptr);
    EXPECT_EQ(contentsOf(path), old);
    EXPECT_EQ(filesIn(folder), 1U);
    ::umount(folder.path().c_str());
    EXPECT_FALSE(replaced || replacedByRange);
    EXPECT_THAT(error.message,
                testing::AllOf(HasSubstr(path), HasSubstr("No space left"), HasSubstr("at byte 0")));
}

TEST(FileReplacement, ALimitOnSizesIsAnErrorToo) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", test::noise(30000));
    struct rlimit former {};
    ::getrlimit(RLIMIT_FSIZE, &former);
    const struct rlimit low { 20000, former.rlim_max };
    const auto formerHandler = std::signal(SIGXFSZ, SIG_IGN);
    ::setrlimit(RLIMIT_FSIZE, &low);
    const FilePiece pieces[] = {{.bytes = "new"}, {.bytes = {}, .offset = 0, .length = 30000}};
    Error error;
    const bool replaced = replaceFileByPieces(path, pieces, {}, &error);
    ::setrlimit(RLIMIT_FSIZE, &former);
    std::signal(SIGXFSZ, formerHandler);
    EXPECT_FALSE(replaced);
    EXPECT_THAT(error.message, HasSubstr("File too large"));
    EXPECT_TRUE(contentsOf(path) == test::noise(30000));
    EXPECT_EQ(filesIn(folder), 1U);
}

TEST(FileReplacement, AFileThatChangedOrShrankMeanwhileIsLeftAlone) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old contents");
    const FileStamp stamp = FileStamp::of(statusOf(path));
    const FilePiece beyond{.bytes = {}, .offset = 4, .length = 100};
    Error error;
    EXPECT_FALSE(replaceFileByPieces(path, {&beyond, 1}, {}, &error)) << "the range ends behind the file";

    FileReplacementOptions options;
    options.expected = stamp;
    options.check = [&](const std::string&, Error*) {
        std::ofstream(path, std::ios::app) << " and more";
        return true;
    };
    const FilePiece whole{.bytes = "new"};
    EXPECT_FALSE(replaceFileByPieces(path, {&whole, 1}, options, &error));
    EXPECT_THAT(error.message, HasSubstr("changed by another program"));
    EXPECT_EQ(contentsOf(path), "old contents and more");
    EXPECT_FALSE(replaceFileByPieces(path, {&whole, 1}, options, &error)) << "the stamp is an old one";
    EXPECT_EQ(filesIn(folder), 1U);
}

TEST(FileReplacement, ACheckSeesTheWholeNewFileAndCanAbandonIt) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    std::string seen;
    FileReplacementOptions options;
    options.check = [&seen](const std::string& newFile, Error*) {
        seen = contentsOf(newFile);
        return false;
    };
    const FilePiece pieces[] = {{.bytes = "new "}, {.bytes = {}, .offset = 0, .length = 3}};
    EXPECT_FALSE(replaceFileByPieces(path, pieces, options));
    EXPECT_EQ(seen, "new old");
    EXPECT_EQ(contentsOf(path), "old");
    EXPECT_EQ(filesIn(folder), 1U);
}

}  // namespace
}  // namespace qvct
