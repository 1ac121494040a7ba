#pragma once

#include "platform/files/FileDescriptor.h"
#include "platform/files/FileStamp.h"

#include <csignal>
#include <cstddef>
#include <string>

#include <sys/types.h>

namespace qvct {

/// A new file on its way to its place: beside it under a hidden name of its own, readable by nobody else, and
/// gone again unless it takes its place.
///
/// The name is ".qvct-PROCESS-NUMBER.tmp". While its owner lives the file is locked (`flock`), so that what a
/// killed process left behind can be told from what is being written.
class UnfinishedFile {
  public:
    /// Makes one in a folder, whose path ends with "/". `mode` is that of its creation, of which the
    /// process's mask and the folder take their part; whatever that leaves, only the owner may read what is
    /// written.
    UnfinishedFile(const std::string& folder, mode_t mode);
    UnfinishedFile(const UnfinishedFile&) = delete;
    UnfinishedFile& operator=(const UnfinishedFile&) = delete;
    ~UnfinishedFile();

    /// False, and `errno` says why, when it could not be made.
    bool isOpen() const { return file_.isOpen(); }
    int descriptor() const { return file_.number(); }
    const std::string& path() const { return path_; }
    /// The mode that it was made with, less what the mask and the folder took from it.
    mode_t modeAtCreation() const { return modeAtCreation_; }

    /// Gives it a name that tells which file is to come out when it is exchanged for the one at its place.
    /// What stands under such a name is removed by a later write only when it is one of these two, for else
    /// it is what another program saved at that moment. Signals that end the program leave it alone for the
    /// same reason. False, and `errno`, on failure.
    bool renameForExchangeWith(const FileStamp& old);
    /// Removes what stands under its name now, unless it was released.
    void remove();
    /// Nothing is left to remove: it took its place, or what stands under its name is not ours.
    void release();

  private:
    bool make(const std::string& name, mode_t mode);
    void giveSlotBack();

    std::string folder_;
    std::string path_;
    FileDescriptor file_{-1};
    mode_t modeAtCreation_ = 0;
    pid_t owner_;  // a forked process has a copy
    std::size_t slot_;
};

/// Removes what killed processes left behind in a folder, whose path ends with "/": regular files of this
/// user under the name of an unfinished file that no living process holds. Where the file system has no
/// locks, only what was left alone for a day. At most once a second for one folder.
void removeLeftFiles(const std::string& folder);

/// Has the signals by which a user ends a program (interrupt, terminate, hang up) remove the unfinished files
/// of this process before they end it. One that another thread is just exchanging stays; the next write in
/// its folder removes it. Those signals that the process ignores stay ignored. For programs of their own: a
/// host's signals are its own affair.
void removeUnfinishedFilesWhenEnded();

/// Holds back the signals by which a user ends a program, for the moments in which nothing knows of a file
/// that is to be removed. In this thread alone: another one may end the program meanwhile.
class EndingSignalsHeld {
  public:
    EndingSignalsHeld();
    EndingSignalsHeld(const EndingSignalsHeld&) = delete;
    EndingSignalsHeld& operator=(const EndingSignalsHeld&) = delete;
    ~EndingSignalsHeld();

  private:
    sigset_t former_{};
};

}  // namespace qvct
