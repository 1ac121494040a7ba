#include "platform/files/FileAccess.h"
#include "platform/files/replacement/FileReplacement.h"
#include "platform/files/replacement/UnfinishedFile.h"
#include "support/AudioFixtures.h"
#include "support/Corpus.h"
#include "support/TemporaryFolder.h"

#include <csignal>
#include <functional>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
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

bool replaceByNew(const std::string& path, const FileReplacementOptions& options, Error* error = nullptr) {
    const FilePiece whole{.bytes = "new"};
    return replaceFileByPieces(path, {&whole, 1}, options, error);
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
            ASSERT_TRUE(replaceFileByPieces(path, pieces, {}, &error)) << error.message();
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
        ASSERT_TRUE(replaceByNew(path, {.keepsTimes = keeps, .expected = {}, .check = {}}));
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
        EXPECT_TRUE(replaceFile(link, "new", &error)) << error.message();
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
    EXPECT_THAT(error.message(), testing::AllOf(HasSubstr(path), HasSubstr("protected from writing")));
    EXPECT_EQ(contentsOf(path), "old");
    std::filesystem::create_directory(folder.path("folder"));
    EXPECT_FALSE(replaceFile(folder.path("folder"), "new", &error));
    EXPECT_FALSE(replaceFile(folder.path("missing/file"), "new", &error));
    std::filesystem::create_symlink(folder.path("nowhere"), folder.path("link"));
    error = {};
    for (const bool isDryRun : {true, false}) {
        FileReplacementOptions options;
        options.isDryRun = isDryRun;
        EXPECT_FALSE(replaceFileByPieces(folder.path("link"), {}, options, &error));
        EXPECT_THAT(error.message(), HasSubstr("link: is a link that leads nowhere"));
    }
    EXPECT_EQ(filesIn(folder), 1U);
}

TEST(FileReplacement, AFolderThatForbidsItIsAnErrorBeforehandAndLosesNothing) {
    struct {
        mode_t mode;
        const char* reason;
    } const folders[] = {{0555, "Permission denied"}, {01777, "only its owner may replace it"}};
    const bool isRoot = ::geteuid() == 0;
    for (const auto& each : folders) {
        if (each.mode == 01777 && !isRoot) continue;  // no other user's file can be made
        const TemporaryFolder folder;
        const std::string path = folder.write("file", "old");
        ::chmod(path.c_str(), 0666);
        ::chmod(folder.path().c_str(), each.mode);
        for (const bool isDryRun : {true, false}) {
            FileReplacementOptions options;
            options.isDryRun = isDryRun;
            Error error;
            ASSERT_EQ(isRoot ? ::seteuid(kNobody) : 0, 0);
            const bool replaced = replaceByNew(path, options, &error);
            ASSERT_EQ(isRoot ? ::seteuid(0) : 0, 0);
            EXPECT_FALSE(replaced) << isDryRun;
            EXPECT_THAT(error.message(), testing::AllOf(HasSubstr(path), HasSubstr(each.reason)));
        }
        ::chmod(folder.path().c_str(), 0755);
        EXPECT_EQ(contentsOf(path), "old");
    }
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
    EXPECT_THAT(error.message(),
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
    EXPECT_THAT(error.message(), HasSubstr("File too large"));
    EXPECT_TRUE(contentsOf(path) == test::noise(30000));
    EXPECT_EQ(filesIn(folder), 1U);
}

TEST(FileReplacement, ARangeBehindTheEndIsAnError) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old contents");
    const FilePiece beyond{.bytes = {}, .offset = 4, .length = 100};
    Error error;
    EXPECT_FALSE(replaceFileByPieces(path, {&beyond, 1}, {}, &error));
    EXPECT_EQ(contentsOf(path), "old contents");
}

TEST(FileReplacement, WhatAnotherProgramSavedMeanwhileStays) {
    struct Save {
        const char* name;
        bool isThereBefore;
        std::function<void(const std::string& path)> save;
        std::string contents;
    };
    const auto renameOver = [](const std::string& path) {
        std::ofstream(path + ".saved") << "saved";
        std::filesystem::rename(path + ".saved", path);
    };
    const Save saves[] = {
        {"in place", true, [](const auto& path) { std::ofstream(path, std::ios::app) << "!"; }, "old!"},
        {"by renaming", true, renameOver, "saved"},
        {"by removing", true, [](const auto& path) { std::filesystem::remove(path); }, "unreadable"},
        {"a new file", false, renameOver, "saved"},
    };
    for (const Save& each : saves) {
        SCOPED_TRACE(each.name);
        const TemporaryFolder folder;
        const std::string path = folder.path("file");
        if (each.isThereBefore) folder.write("file", "old");
        FileReplacementOptions options;
        options.expected = FileStamp::ofFile(path);
        options.check = [&](const std::string&, Error*) {
            each.save(path);
            return true;
        };
        for (int round = 0; round < 2; ++round) {  // the second time the state is an old one from the start
            Error error;
            EXPECT_FALSE(replaceByNew(path, options, &error));
            EXPECT_THAT(error.message(), HasSubstr("changed by another program"));
            EXPECT_EQ(contentsOf(path), each.contents);
            EXPECT_EQ(filesIn(folder), each.contents == "unreadable" ? 0U : 1U);
        }
    }
}

TEST(FileReplacement, NobodyElseCanReadTheNewFileBeforeItIsInPlace) {
    const mode_t former = ::umask(022);
    for (const mode_t mode : {0600U, 0644U, 0U}) {  // 0: there is no file yet
        const TemporaryFolder folder;
        const std::string path = folder.path("file");
        if (mode != 0) ::chmod(folder.write("file", "old").c_str(), mode);
        mode_t seen = 0;
        FileReplacementOptions options;
        options.check = [&seen](const std::string& newFile, Error*) {
            seen = statusOf(newFile).st_mode & 07777U;
            return true;
        };
        EXPECT_TRUE(replaceByNew(path, options));
        EXPECT_EQ(seen, 0600U);
        EXPECT_EQ(statusOf(path).st_mode & 07777U, mode == 0 ? 0644U : mode);
    }
    ::umask(former);
}

TEST(FileReplacement, AnotherGroupMayDoNoMoreThanEverybody) {
    if (::geteuid() != 0) GTEST_SKIP() << "no right to give files away";
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    ASSERT_EQ(::chown(path.c_str(), kNobody, 4321), 0);
    ::chmod(path.c_str(), 0660);
    ::chmod(folder.path().c_str(), 0777);
    ASSERT_EQ(::seteuid(kNobody), 0);
    const bool replaced = replaceFile(path, "new");
    ASSERT_EQ(::seteuid(0), 0);
    EXPECT_TRUE(replaced);
    EXPECT_NE(statusOf(path).st_gid, 4321U);
    EXPECT_EQ(statusOf(path).st_mode & 07777U, 0600U);
}

/// 8 MB with three holes, one of them at the end, and data between.
std::string sparseFile(const TemporaryFolder& folder) {
    constexpr std::uint64_t kSize = 8U << 20U;
    const std::string path = folder.write("file", "head");
    std::filesystem::resize_file(path, kSize);
    std::fstream(path, std::ios::in | std::ios::out).seekp(kSize / 2) << test::noise(5000);
    std::filesystem::resize_file(path, kSize + 1);
    return path;
}

TEST(FileReplacement, HolesStayHoles) {
    for (const bool isInFront : {false, true}) {
        const TemporaryFolder folder;
        const std::string path = sparseFile(folder);
        if (statusOf(path).st_blocks > 1000) GTEST_SKIP() << "the file system knows no holes";
        const std::string old = contentsOf(path);
        std::vector<FilePiece> pieces{{.bytes = {}, .offset = 0, .length = old.size()}, {.bytes = "tag"}};
        if (isInFront) std::swap(pieces[0], pieces[1]);
        ASSERT_TRUE(replaceFileByPieces(path, pieces));
        EXPECT_TRUE(contentsOf(path) == (isInFront ? "tag" + old : old + "tag"));
        EXPECT_LT(statusOf(path).st_blocks, 100);
    }
    const TemporaryFolder folder;
    const std::string path = sparseFile(folder);
    const FilePiece head{.bytes = {}, .offset = 0, .length = 5U << 20U};
    ASSERT_TRUE(replaceFileByPieces(path, {&head, 1}));
    EXPECT_EQ(std::filesystem::file_size(path), head.length) << "ends in a hole";
}

/// Does something in another process; how that ended.
int statusOfProcess(const std::function<bool()>& work) {
    const pid_t child = ::fork();
    if (child == 0) ::_exit(work() ? 0 : 1);
    int status = 0;
    ::waitpid(child, &status, 0);
    return status;
}

/// Does something in the middle of writing "new" to `path`.
bool writeAndMeanwhile(const std::string& path, const std::function<bool()>& work) {
    removeUnfinishedFilesWhenEnded();
    FileReplacementOptions options;
    options.check = [&](const std::string&, Error*) { return work(); };
    return replaceByNew(path, options);
}

/// Sends a signal to a process in the middle of writing `path`; how the process ended.
int statusAfterSignal(const std::string& path, int signal, bool isIgnored = false) {
    return statusOfProcess([&] {
        std::signal(signal, isIgnored ? SIG_IGN : SIG_DFL);  // whatever this process was started with
        return writeAndMeanwhile(path, [&] { return ::raise(signal) == 0; });
    });
}

TEST(FileReplacement, AUserWhoEndsTheProgramFindsNothingLeftBehind) {
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        const TemporaryFolder folder;
        const std::string path = folder.write("file", "old");
        const int status = statusAfterSignal(path, signal);
        EXPECT_TRUE(WIFSIGNALED(status) && WTERMSIG(status) == signal) << status;
        EXPECT_EQ(filesIn(folder), 1U);
        EXPECT_EQ(contentsOf(path), "old");
        EXPECT_EQ(statusAfterSignal(path, signal, true), 0) << "an ignored signal ended it";
        EXPECT_EQ(contentsOf(path), "new");
    }
    const TemporaryFolder folder;
    const auto endAFork = [] { return WIFSIGNALED(statusOfProcess([] { return ::raise(SIGTERM) == 0; })); };
    const auto abandonInAFork = [] {
        const pid_t fork = ::fork();
        if (fork != 0) ::waitpid(fork, nullptr, 0);
        return fork != 0;
    };
    for (const std::function<bool()>& work : {std::function<bool()>(endAFork), {abandonInAFork}}) {
        EXPECT_EQ(statusOfProcess([&] { return writeAndMeanwhile(folder.path("file"), work); }), 0)
            << "a process that it forked removed its file";
    }
}

TEST(FileReplacement, WhatAKilledProcessLeftIsRemovedByTheNextWriteAndNothingElse) {
    const TemporaryFolder folder;
    const std::string path = folder.write("file", "old");
    const std::vector<std::string> kept = {".qvct-mine.tmp",         ".qvct-1-0.tmp.bak", "qvct-1-0.tmp",
                                           ".qvct-1-0-a0-b0.tmp",    ".qvct-1.tmp",       ".qvct--1-0.tmp",
                                           ".qvct-1-0-a0-b0-c0.tmp", ".qvct-1-0x1.tmp",   "xqvct-1-0.tmp",
                                           ".qvct-1-0xtmp"};
    for (const std::string& name : kept) folder.write(name, "user's");
    const std::string victim = folder.write("victim", "user's");
    std::filesystem::create_symlink(victim, folder.path(".qvct-2-0.tmp"));
    std::filesystem::create_directory(folder.path(".qvct-2-1.tmp"));
    ::mkfifo(folder.path(".qvct-2-2.tmp").c_str(), 0600);
    const std::string foreign = folder.write(".qvct-2-3.tmp", "another user's");
    const bool isRoot = ::chown(foreign.c_str(), kNobody, kNobody) == 0;
    for (int i = 0; i < 2; ++i) statusAfterSignal(path, SIGKILL);
    const auto entries = [&] {
        const std::filesystem::directory_iterator all(folder.path());
        return static_cast<std::size_t>(std::distance(begin(all), end(all)));
    };
    const std::size_t others = kept.size() + 6;
    EXPECT_EQ(entries(), others + 1) << "each removes what the one before left";
    EXPECT_EQ(contentsOf(path), "old");

    FileReplacementOptions options;
    options.check = [&](const std::string& newFile, Error*) {
        EXPECT_EQ(entries(), others + (isRoot ? 1 : 0));
        // Another write meanwhile, that looks through the folder as well.
        ::usleep(1'100'000);
        EXPECT_TRUE(replaceFile(victim, "user's"));
        return std::filesystem::exists(newFile);
    };
    EXPECT_TRUE(replaceByNew(path, options)) << "a living writer's file was removed";
    EXPECT_EQ(entries(), others - (isRoot ? 0 : 1));
    for (const std::string& name : kept) EXPECT_EQ(contentsOf(folder.path(name)), "user's") << name;
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
