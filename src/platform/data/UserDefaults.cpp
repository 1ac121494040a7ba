#include "platform/data/UserDefaults.h"

#include "platform/data/PropertyList.h"

#include <cstdlib>
#include <map>
#include <mutex>
#include <string>

namespace qvct {
namespace {

std::mutex defaultsMutex;

std::map<std::string, bool, std::less<>>& values() {
    static std::map<std::string, bool, std::less<>> map;
    return map;
}

}  // namespace

bool UserDefaults::boolForKey(std::string_view key) {
    const std::lock_guard lock(defaultsMutex);
    if (const auto hit = values().find(key); hit != values().end()) return hit->second;
    const char* text = std::getenv(("QVCT_DEFAULT_" + std::string(key)).c_str());
    return text != nullptr && PropertyList(text).boolValue();
}

void UserDefaults::setBool(bool value, std::string_view key) {
    const std::lock_guard lock(defaultsMutex);
    values().insert_or_assign(std::string(key), value);
}

}  // namespace qvct
