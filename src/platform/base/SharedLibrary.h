#pragma once

#include "platform/base/Error.h"

#include <optional>
#include <string>
#include <utility>

namespace qvct {

/// A library of the system that is loaded while the program runs. It stays until the process ends: a library
/// that has threads of its own cannot be unloaded safely.
class SharedLibrary {
  public:
    /// Loads a library by its name with version, as the system's loader finds it. Nothing, and an error, when
    /// the loader does not find it.
    static std::optional<SharedLibrary> load(const std::string& name, Error* error = nullptr);

    /// Whether the library has such a function, which is then put into `function`. The caller vouches for its
    /// type.
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
