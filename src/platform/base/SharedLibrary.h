#pragma once

#include "platform/base/Error.h"

#include <optional>
#include <string>
#include <utility>

namespace qvct {

/// A library of the system that is loaded while the program runs. It stays until the process ends: what runs
/// in threads of its own cannot be unloaded safely.
class SharedLibrary {
  public:
    /// By its name with version, as the system's loader finds it. Nothing, and an error, when it does not.
    static std::optional<SharedLibrary> load(const std::string& name, Error* error = nullptr);

    /// Whether the library has such a function; it is put into `function`, whose type is the caller's word.
    template <typename Function>
    bool find(const char* name, Function*& function, Error* error = nullptr) const {
        function = reinterpret_cast<Function*>(address(name, error));
        return function != nullptr;
    }

  private:
    SharedLibrary(std::string name, void* handle) : name_(std::move(name)), handle_(handle) {}
    void* address(const char* name, Error* error) const;

    std::string name_;
    void* handle_;
};

}  // namespace qvct
