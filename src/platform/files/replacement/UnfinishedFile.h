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
    /// Makes one in a folder, whose path ends with "/". It is created with `mode`, from which the process's
    /// mask and the folder take away bits (see `modeAtCreation`); until it is finished only its owner can
    /// read it.
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

    /// Gives it a name that identifies both this file and the old one that it is to be exchanged with. A
    /// later write removes a file of such a name only if it is one of these two; any other is what another
    /// program saved at that moment. Signals that end the program leave it alone for the same reason. False,
    /// and `errno` says why, on failure.
    bool renameForExchangeWith(const FileStamp& old);
    /// Removes what stands under its name now, unless it was released.
    void remove();
    /// Keeps `remove` from doing anything: the file took its place, or what stands under its name is not
    /// ours.
    void release();

  private:
    bool make(const std::string& name, mode_t mode);
    void giveSlotBack();

    std::string folder_;
    std::string path_;
    FileDescriptor file_{-1};
    mode_t modeAtCreation_ = 0;
    pid_t owner_;  // tells this process from one forked from it
    std::size_t slot_;
};

/// Removes what killed processes left behind in a folder, whose path ends with "/": regular files of this
/// user under the name of an unfinished file that no living process holds. Where the file system has no
/// locks, only what was left alone for a day. At most once a second for one folder.
void removeLeftFiles(const std::string& folder);

/// Has the signals by which a user ends a program (interrupt, terminate, hang up) remove the unfinished files
/// of this process before they end it. A file that another thread is just exchanging stays; the next write in
/// its folder removes it. Signals that the process ignores stay ignored. For stand-alone programs only: a
/// library must not touch its host's signals.
void removeUnfinishedFilesWhenEnded();

/// Blocks the signals by which a user ends a program, during the moments in which a file exists that the
/// signal handler does not know of. Blocks them in this thread alone: another thread may still receive one
/// and end the program.
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
