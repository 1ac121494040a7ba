#pragma once

#include "platform/base/Log.h"

#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace qvct::test {

/// Takes the log for as long as it lives.
class CapturedLog {
  public:
    CapturedLog()
        : before_(setLogHandler([this](std::string_view message) {
              const std::lock_guard lock(mutex_);
              messages_.emplace_back(message);
          })) {}
    CapturedLog(const CapturedLog&) = delete;
    CapturedLog& operator=(const CapturedLog&) = delete;
    ~CapturedLog() { setLogHandler(std::move(before_)); }

    const std::vector<std::string>& messages() const { return messages_; }

  private:
    std::mutex mutex_;
    std::vector<std::string> messages_;
    LogHandler before_;
};

}  // namespace qvct::test
