#include "MarletFoundation/Platform/URL.h"

#include <limits.h>
#include <stdlib.h>
#include <strings.h>
#include <unistd.h>
#include <uriparser/Uri.h>

#include <algorithm>

namespace MarletFoundation {
namespace {

constexpr std::string_view PathCharacters =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-._~!$&'()*+,;=:@/";

std::string percentEncoded(std::string_view path) {
  constexpr std::string_view digits = "0123456789ABCDEF";
  std::string encoded;
  encoded.reserve(path.size());
  for (const char c : path) {
    if (PathCharacters.find(c) != std::string_view::npos) {
      encoded += c;
    } else {
      const auto byte = static_cast<unsigned char>(c);
      encoded += {'%', digits[byte >> 4], digits[byte & 15]};
    }
  }
  return encoded;
}

int hexValue(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  c = static_cast<char>(c | 0x20);
  return c >= 'a' && c <= 'f' ? c - 'a' + 10 : -1;
}

std::string percentDecoded(std::string_view text) {
  std::string decoded;
  decoded.reserve(text.size());
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '%' && i + 2 < text.size() && hexValue(text[i + 1]) >= 0 && hexValue(text[i + 2]) >= 0) {
      decoded += static_cast<char>(hexValue(text[i + 1]) * 16 + hexValue(text[i + 2]));
      i += 2;
    } else {
      decoded += text[i];
    }
  }
  return decoded;
}

/// A parsed URI reference; its ranges point into the text, which must outlive it.
class ParsedURI {
 public:
  explicit ParsedURI(std::string_view text)
      : valid_(uriParseSingleUriExA(&uri_, text.data(), text.data() + text.size(), nullptr) == URI_SUCCESS) {}
  ~ParsedURI() {
    if (valid_) uriFreeUriMembersA(&uri_);
  }
  ParsedURI(const ParsedURI&) = delete;
  ParsedURI& operator=(const ParsedURI&) = delete;

  bool valid() const { return valid_; }
  std::string_view scheme() const { return view(uri_.scheme); }
  std::string_view host() const { return view(uri_.hostText); }
  bool hasQueryOrFragment() const { return uri_.query.first || uri_.fragment.first; }

  /// This reference resolved against an absolute URI, or nothing when that has no scheme.
  std::optional<std::string> resolved(const ParsedURI& base) const {
    UriUriA result;
    std::optional<std::string> text;
    if (uriAddBaseUriExA(&result, &uri_, &base.uri_, URI_RESOLVE_STRICTLY) == URI_SUCCESS) {
      int length = 0;
      if (uriToStringCharsRequiredA(&result, &length) == URI_SUCCESS) {
        text.emplace(static_cast<std::size_t>(length) + 1, '\0');
        if (uriToStringA(text->data(), &result, length + 1, nullptr) == URI_SUCCESS) {
          text->pop_back();
        } else {
          text.reset();
        }
      }
    }
    uriFreeUriMembersA(&result);
    return text;
  }

 private:
  static std::string_view view(const UriTextRangeA& range) {
    return range.first
               ? std::string_view(range.first, static_cast<std::size_t>(range.afterLast - range.first))
               : std::string_view();
  }

  UriUriA uri_;
  bool valid_;
};

/// A URI reference cut into what stands before its path (scheme and authority), the path, and the rest.
struct Parts {
  std::string_view head, path, tail;

  explicit Parts(std::string_view text) {
    const auto pathEnd = std::min(text.find_first_of("?#"), text.size());
    tail = text.substr(pathEnd);
    text = text.substr(0, pathEnd);
    std::size_t start = 0;
    const auto colon = text.find(':');
    if (colon != std::string_view::npos && colon < text.find('/')) start = colon + 1;
    if (text.substr(start).starts_with("//")) start = std::min(text.find('/', start + 2), text.size());
    head = text.substr(0, start);
    path = text.substr(start);
  }

  std::string with(std::string_view newPath) const { return std::string(head).append(newPath).append(tail); }
};

std::string_view withoutTrailingSlashes(std::string_view path) {
  while (path.size() > 1 && path.ends_with('/')) path.remove_suffix(1);
  return path;
}

std::string_view lastComponent(std::string_view path) {
  path = withoutTrailingSlashes(path);
  return path == "/" ? path : path.substr(path.rfind('/') + 1);
}

std::string_view extensionOf(std::string_view name) {
  const auto dot = name.rfind('.');
  return dot == std::string_view::npos || dot == 0 ? std::string_view() : name.substr(dot + 1);
}

std::string joined(std::string_view path, std::string_view component) {
  while (component.starts_with('/')) component.remove_prefix(1);
  std::string result;
  result.reserve(path.size() + 1 + component.size());
  result.append(path);
  if (!path.empty() && !path.ends_with('/') && !component.empty()) result += '/';
  return result.append(component);
}

std::string parentOf(std::string_view path) {
  path = withoutTrailingSlashes(path);
  const auto slash = path.rfind('/');
  if (slash == std::string_view::npos) return {};
  return std::string(withoutTrailingSlashes(path.substr(0, std::max<std::size_t>(slash, 1))));
}

std::string standardizedPath(std::string_view path) {
  std::vector<std::string_view> kept;
  const bool absolute = path.starts_with('/');
  for (std::size_t start = 0; start <= path.size();) {
    const auto end = std::min(path.find('/', start), path.size());
    const auto component = path.substr(start, end - start);
    start = end + 1;
    if (component.empty() || component == ".") continue;
    if (component != "..") {
      kept.push_back(component);
    } else if (!kept.empty() && kept.back() != "..") {
      kept.pop_back();
    } else if (!absolute) {
      kept.push_back(component);
    }
  }
  std::string result;
  for (const auto component : kept) {
    if (absolute || !result.empty()) result += '/';
    result += component;
  }
  return result.empty() && absolute ? "/" : result;
}

}  // namespace

URL::URL(std::string text, bool isFile, bool isDirectory, std::shared_ptr<const URL> base)
    : text_(std::move(text)), isFile_(isFile), isDirectory_(isDirectory), base_(std::move(base)) {}

URL URL::file(std::string_view path, bool isDirectory) {
  isDirectory = isDirectory || path.empty() || path.ends_with('/');
  path = withoutTrailingSlashes(path);
  if (path.starts_with('/')) return {std::string(path), true, isDirectory || path == "/", nullptr};
  const std::unique_ptr<char, decltype(&std::free)> current(::getcwd(nullptr, 0), &std::free);
  return {joined(current ? current.get() : "/", path), true, isDirectory, nullptr};
}

std::optional<URL> URL::parse(std::string_view string, const URL* base) {
  if (string.empty() || string.size() > INT_MAX / 8) return std::nullopt;
  const ParsedURI parsed(string);
  if (!parsed.valid()) return std::nullopt;
  std::string scheme(parsed.scheme());
  const auto path = Parts(string).path;
  if (::strcasecmp(scheme.c_str(), "file") == 0 && !parsed.hasQueryOrFragment() && path.starts_with('/') &&
      (parsed.host().empty() || parsed.host() == "localhost")) {
    return file(percentDecoded(path), path.ends_with('/'));
  }
  const bool relative = scheme.empty() && base;
  return URL(std::string(string), false, path.ends_with('/'),
             relative ? std::make_shared<URL>(*base) : nullptr);
}

bool URL::isFileURL() const { return isFile_ || (base_ && base_->isFileURL() && !text_.starts_with("//")); }

std::optional<std::string> URL::scheme() const {
  if (isFile_) return "file";
  const ParsedURI parsed(text_);
  if (!parsed.scheme().empty()) return std::string(parsed.scheme());
  return base_ ? base_->scheme() : std::nullopt;
}

std::string URL::path() const {
  if (isFile_) return text_;
  const std::string whole = absoluteString();
  return percentDecoded(withoutTrailingSlashes(Parts(whole).path));
}

std::string URL::absoluteString() const {
  if (isFile_) {
    auto string = "file://" + percentEncoded(text_);
    if (isDirectory_ && text_ != "/") string += '/';
    return string;
  }
  if (!base_) return text_;
  const std::string baseString = base_->absoluteString();
  const ParsedURI base(baseString);
  if (!base.valid()) return text_;
  return ParsedURI(text_).resolved(base).value_or(text_);
}

std::string URL::relativeString() const { return isFile_ ? absoluteString() : text_; }

std::optional<URL> URL::baseURL() const { return base_ ? std::optional(*base_) : std::nullopt; }

std::string URL::lastPathComponent() const {
  if (isFile_) return std::string(lastComponent(text_));
  return std::string(lastComponent(path()));
}

std::string URL::pathExtension() const {
  if (isFile_) return std::string(extensionOf(lastComponent(text_)));
  return std::string(extensionOf(lastPathComponent()));
}

std::vector<std::string> URL::pathComponents() const {
  const std::string whole = path();
  std::vector<std::string> components;
  if (whole.starts_with('/')) components.emplace_back("/");
  for (std::size_t start = 0; start < whole.size();) {
    const auto end = std::min(whole.find('/', start), whole.size());
    if (end > start) components.push_back(whole.substr(start, end - start));
    start = end + 1;
  }
  return components;
}

URL URL::appendingPathComponent(std::string_view component, bool isDirectory) const {
  isDirectory = isDirectory || component.ends_with('/') || (component.empty() && isDirectory_);
  component = component == "/" ? std::string_view() : withoutTrailingSlashes(component);
  if (isFile_) return {joined(text_, component), true, isDirectory, base_};
  const Parts parts(text_);
  auto path = joined(parts.path, percentEncoded(component));
  if (parts.path.empty() && !parts.head.empty()) path.insert(0, 1, '/');
  if (isDirectory && !path.ends_with('/')) path += '/';
  return {parts.with(path), false, isDirectory, base_};
}

URL URL::appendingPathExtension(std::string_view extension) const {
  if (isFile_) {
    return text_ == "/" || extension.empty()
               ? *this
               : URL(std::string(text_).append(1, '.').append(extension), true, isDirectory_, base_);
  }
  const Parts parts(text_);
  const auto path = withoutTrailingSlashes(parts.path);
  if (path.empty() || path == "/" || extension.empty()) return *this;
  auto extended = std::string(path) + "." + percentEncoded(extension);
  if (isDirectory_) extended += '/';
  return {parts.with(extended), false, isDirectory_, base_};
}

URL URL::deletingLastPathComponent() const {
  if (isFile_) return {parentOf(text_), true, true, base_};
  const Parts parts(text_);
  auto parent = parentOf(parts.path);
  if (parent.empty()) parent = ".";
  if (!parent.ends_with('/')) parent += '/';
  return {parts.with(parent), false, true, base_};
}

URL URL::standardized() const {
  if (isFile_) return {standardizedPath(text_), true, isDirectory_, base_};
  const Parts parts(text_);
  auto path = standardizedPath(parts.path);
  if (isDirectory_ && !path.empty() && !path.ends_with('/')) path += '/';
  return {parts.with(path), false, isDirectory_, base_};
}

URL URL::resolvingSymlinksInPath() const {
  if (!isFileURL()) return *this;
  const std::string whole = path();
  if (whole.find('\0') != std::string::npos) return *this;
  std::string existing = whole;
  while (true) {
    const std::unique_ptr<char, decltype(&std::free)> real(::realpath(existing.c_str(), nullptr), &std::free);
    if (real) {
      return {joined(real.get(), std::string_view(whole).substr(existing.size())), true, isDirectory_,
              nullptr};
    }
    if (existing == "/" || existing.empty()) return *this;
    existing = parentOf(existing);
  }
}

std::optional<std::string> URL::securityScope() const {
  return securityScope_ ? std::optional(*securityScope_) : std::nullopt;
}

URL URL::attachingSecurityScope(std::string token) const {
  auto url = *this;
  url.securityScope_ = std::make_shared<const std::string>(std::move(token));
  return url;
}

bool URL::operator==(const URL& other) const { return (*this <=> other) == 0; }

std::strong_ordering URL::operator<=>(const URL& other) const {
  if (const auto order = text_ <=> other.text_; order != 0) return order;
  if (const auto order = isFile_ <=> other.isFile_; order != 0) return order;
  if (const auto order = isDirectory_ <=> other.isDirectory_; order != 0) return order;
  if (!base_ || !other.base_) return static_cast<bool>(base_) <=> static_cast<bool>(other.base_);
  return *base_ <=> *other.base_;
}

std::size_t URL::hash() const {
  const auto own = std::hash<std::string>()(text_) * 4 + (isDirectory_ ? 1 : 0) + (isFile_ ? 2 : 0);
  return base_ ? own * 31 + base_->hash() : own;
}

}  // namespace MarletFoundation
