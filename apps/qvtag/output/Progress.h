#pragma once

#include <chrono>
#include <cstdint>

namespace qvct::tool {

/// A line on standard error with how far a run is, its rate and the time left; only on a terminal.
class Progress {
  public:
    explicit Progress(bool isQuiet);
    ~Progress() { hide(); }
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    bool isShown() const { return isShown_; }
    /// A total of 0 is unknown.
    void show(std::uint64_t done, std::uint64_t total);
    /// Clears the line, so that a message can be written.
    void hide();
    /// Since the run began.
    double seconds() const;

  private:
    std::chrono::steady_clock::time_point start_;
    bool isShown_;
    bool hasLine_ = false;
};

}  // namespace qvct::tool
