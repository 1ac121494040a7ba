#include "platform/text/Url.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <filesystem>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kFileScheme = "file://";

bool isUnreserved(unsigned char c) {
    constexpr std::string_view kept = "-._~/!$&'()*+,=:@";
    return (c >= '0' && c <= '9') || (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') ||
           kept.find(static_cast<char>(c)) != std::string_view::npos;
}

std::string percentEncoded(std::string_view text) {
    std::string result;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        result += isUnreserved(byte) ? std::string(1, c) : fmt::format("%{:02X}", byte);
    }
    return result;
}

int hexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return -1;
}

std::string percentDecoded(std::string_view text) {
    std::string result;
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool escape = text[i] == '%' && i + 2 < text.size();
        const int high = escape ? hexDigit(text[i + 1]) : -1;
        const int low = escape ? hexDigit(text[i + 2]) : -1;
        if (high >= 0 && low >= 0) {
            result += static_cast<char>(high * 16 + low);
            i += 2;
        } else {
            result += text[i];
        }
    }
    return result;
}

}  // namespace

URL::URL(bool isFile, std::string text, std::string path)
    : isFile_(isFile), text_(std::move(text)), path_(std::move(path)) {}

URL URL::fileURLWithPath(std::string_view path) {
    std::error_code ignored;
    std::filesystem::path normal(path);
    if (normal.is_relative()) normal = std::filesystem::current_path(ignored) / normal;
    std::string text = normal.lexically_normal().string();
    if (text.size() > 1 && text.ends_with('/')) text.pop_back();
    return {true, {}, std::move(text)};
}

URL URL::URLWithString(std::string_view text) {
    if (text.starts_with(kFileScheme)) {
        const std::string_view rest = text.substr(kFileScheme.size());
        const std::size_t slash = rest.find('/');  // skips a host such as "localhost"
        return fileURLWithPath(percentDecoded(slash == std::string_view::npos ? "/" : rest.substr(slash)));
    }
    const std::size_t host = text.find("://");
    const std::size_t slash = host == std::string_view::npos ? 0 : text.find('/', host + 3);
    const std::string_view path = slash == std::string_view::npos ? std::string_view{} : text.substr(slash);
    return {false, std::string(text), percentDecoded(path)};
}

std::string URL::absoluteString() const {
    return isFile_ ? std::string(kFileScheme) + percentEncoded(path_) : text_;
}

std::string URL::decodedString() const {
    return isFile_ ? std::string(kFileScheme) + path_ : percentDecoded(text_);
}

std::string URL::lastPathComponent() const {
    if (path_ == "/") return path_;
    return path_.substr(path_.rfind('/') + 1);
}

std::string URL::pathExtension() const {
    const std::string name = lastPathComponent();
    const std::size_t dot = name.rfind('.');
    return dot == std::string::npos || dot == 0 ? std::string{} : name.substr(dot + 1);
}

std::string URL::lowercasePathExtension() const {
    return lowercase(pathExtension());
}

std::string URL::lastPathComponentWithoutExtension() const {
    std::string name = lastPathComponent();
    const std::size_t dot = name.rfind('.');
    if (dot != std::string::npos && dot != 0) name.resize(dot);
    return name;
}

URL URL::URLByAppendingPathComponent(std::string_view component) const {
    const std::string separator = path_.ends_with('/') ? "" : "/";
    return {isFile_, isFile_ ? "" : text_ + separator + percentEncoded(component),
            path_ + separator + std::string(component)};
}

URL URL::URLByAppendingPathExtension(std::string_view extension) const {
    return {isFile_, isFile_ ? "" : text_ + "." + percentEncoded(extension),
            path_ + "." + std::string(extension)};
}

URL URL::URLByDeletingLastPathComponent() const {
    const std::size_t slash = path_.rfind('/');
    std::string parent = slash == std::string::npos || slash == 0 ? "/" : path_.substr(0, slash);
    return {isFile_, isFile_ ? "" : text_.substr(0, text_.rfind('/')), std::move(parent)};
}

bool isURLText(std::string_view path) {
    const std::size_t scheme = path.find("://");
    return scheme != std::string_view::npos && scheme > 0 &&
           std::all_of(path.begin(), path.begin() + static_cast<std::ptrdiff_t>(scheme),
                       [](char c) { return isAsciiWordCharacter(c) || c == '+' || c == '-' || c == '.'; });
}

}  // namespace qvct
