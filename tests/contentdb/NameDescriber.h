#pragma once

#include "contentdb/IndexedItem.h"
#include "platform/base/Log.h"
#include "platform/files/FileAccess.h"
#include "platform/files/ResourceBundle.h"
#include "platform/text/Url.h"
#include "support/RunTool.h"
#include "taxonomy/TaggingTypes.h"

#include <chrono>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <optional>
#include <stdexcept>
#include <string>
#include <thread>

#include <sys/prctl.h>
#include <sys/ptrace.h>
#include <unistd.h>

namespace qvct::test {

/// Describes a file by its name and bytes; some names make it fail, crash or hang.
class NameDescriber : public contentdb::ItemDescriber {
  public:
    std::optional<contentdb::IndexedItem> describe(const std::string& path, Error* error) override {
        const URL url = URL::fileURLWithPath(path);
        contentdb::IndexedItem item;
        item.name = url.lastPathComponentWithoutExtension();
        const auto is = [&item](std::string_view word) { return item.name.find(word) != std::string::npos; };
        if (is("vanishes")) std::filesystem::remove(path);
        if (is("fails") || !std::filesystem::exists(path)) {
            qvct::fail(error, kErrorMalformed, "it is broken", {path + (is("beside") ? ".plist" : "")});
            return std::nullopt;
        }
        if (is("is silent")) return std::nullopt;
        if (is("logs")) log("about " + item.name);
        if (is("shouts")) log(std::string(1U << 18U, '!'));  // more than fits while nobody listens
        if (is("is held")) haveThisProcessHeld();
        if (is("tells")) {
            item.title = openFiles();
            item.packs = {ResourceBundle::directory()};
        }
        if (is("crashes")) {
            ::signal(SIGSEGV, SIG_DFL);  // a sanitizer would report it and exit
            ::raise(SIGSEGV);
        }
        if (is("exits")) ::_exit(3);
        if (is("noted")) std::ofstream(path) << ::getpid();
        if (is("hangs")) std::this_thread::sleep_for(std::chrono::hours(1));
        if (is("throws")) throw std::runtime_error("out of luck");
        if (is("mumbles")) throw std::runtime_error("");
        if (is("slow")) std::this_thread::sleep_for(std::chrono::milliseconds(2));
        item.fileType = kFileTypeAudioFile;
        const std::filesystem::path folder = std::filesystem::path(path).parent_path();
        if (std::filesystem::remove(folder / "leaves")) std::filesystem::rename(folder, folder / "../away");
        if (!isDirectory(path)) item.payloadHash = readAll(path);
        if (item.payloadHash == "before") std::ofstream(path) << "after!";
        item.taggings = {{"Drums", "Source", {}, {}, contentdb::Provenance::automatic, "names"}};
        return item;
    }

    /// What this process has open, apart from standard error.
    static std::string openFiles() {
        std::string targets;
        for (int file = 0; file < 1000; ++file) {
            std::error_code isNotOpen;
            const auto target =
                std::filesystem::read_symlink("/proc/self/fd/" + std::to_string(file), isNotOpen);
            if (!isNotOpen && file != STDERR_FILENO) targets += target.string().substr(0, 7) + ' ';
        }
        return targets;
    }

  private:
    /// By one that traces it and asks nothing: it stays in the system's table when it has ended, as one does
    /// that cannot end.
    static void haveThisProcessHeld() {
        int held[2] = {};
        if (::pipe(held) != 0) return;
        const pid_t self = ::getpid();
        ::prctl(PR_SET_PTRACER, PR_SET_PTRACER_ANY);
        if (::fork() == 0) {
            ::ptrace(PTRACE_SEIZE, self, nullptr, nullptr);
            ::close_range(0, ~0U, 0);
            ::sleep(20);
            ::_exit(0);
        }
        ::close(held[1]);
        char nothing = 0;
        static_cast<void>(::read(held[0], &nothing, 1) == 0);
        ::close(held[0]);
    }
};

}  // namespace qvct::test
