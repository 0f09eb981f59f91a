#include "ArcCopier/EntryPath.h"

#include <limits.h>

#include <cerrno>

#include "MarletFoundation/Platform/Text.h"

namespace ArcCopierImplementation {
namespace {

/// Bytes from 0x80 on of code page 437.
constexpr char16_t CodePage437[] =
    u"ÇüéâäàåçêëèïîìÄÅÉæÆôöòûùÿÖÜ¢£¥₧ƒáíóúñÑªº¿⌐¬½¼¡«»░▒▓│┤╡╢╖╕╣║╗╝╜╛┐"
    u"└┴┬├─┼╞╟╚╔╩╦╠═╬╧╨╤╥╙╘╒╓╫╪┘┌█▄▌▐▀αßΓπΣσµτΦΘΩδ∞φε∩≡±≥≤⌠⌡÷≈°∙·√ⁿ²■\u00A0";
static_assert(std::size(CodePage437) == 128 + 1);

std::string decoded(std::string_view name, bool isMarkedUTF8, Problem& problem) {
  if (MarletFoundation::isValidUTF8(name)) return std::string(name);
  std::u16string text;
  if (isMarkedUTF8) {
    problem = {EILSEQ, "its name is not the UTF-8 that it claims to be"};
    std::string shown;
    while (!name.empty()) {
      const auto valid = MarletFoundation::utf8PrefixLength(name);
      shown += name.substr(0, valid);
      name.remove_prefix(valid);
      if (name.empty()) break;
      shown += "\uFFFD";
      name.remove_prefix(1);
    }
    return shown;
  }
  for (const auto c : name) {
    const auto byte = static_cast<unsigned char>(c);
    text += byte < 0x80 ? static_cast<char16_t>(byte) : CodePage437[byte - 0x80];
  }
  return MarletFoundation::utf8FromUTF16Lossy(text);
}

std::string withoutNULs(std::string_view text) {
  std::string shown;
  for (const char c : text) c == '\0' ? shown += "\uFFFD" : shown += c;
  return shown;
}

bool isDrive(std::string_view name) {
  return name.size() >= 2 && name[1] == ':' && ((name[0] | 0x20) >= 'a' && (name[0] | 0x20) <= 'z');
}

Problem problemOfName(std::string_view name) {
  if (name.empty()) return {EINVAL, "it has no name"};
  if (name.find('\0') != std::string_view::npos) return {EINVAL, "its name holds a NUL"};
  if (name.front() == '/') return {EINVAL, "its path is absolute"};
  if (isDrive(name)) return {EINVAL, "its path names a drive"};
  if (name.find('\\') != std::string_view::npos) return {EINVAL, "its path holds a backslash"};
  return {};
}

}  // namespace

EntryPath entryPath(std::string_view name, bool isMarkedUTF8) {
  EntryPath path{};
  path.shown = decoded(name, isMarkedUTF8, path.problem);
  path.isDirectory = name.ends_with('/') || name.ends_with("/.") || name == ".";
  if (!path.problem) path.problem = problemOfName(path.shown);
  path.shown = withoutNULs(path.shown);
  while (path.shown.size() > 1 && path.shown.ends_with('/')) path.shown.pop_back();
  if (path.problem) return path;

  std::string normalized;
  for (const auto component : MarletFoundation::split(path.shown, '/')) {
    if (component.empty() || component == ".") continue;
    if (component == "..") path.problem = {EINVAL, "its path has \"..\""};
    if (component.size() > NAME_MAX) path.problem = {ENAMETOOLONG, "its name is too long"};
    if (!normalized.empty()) normalized += '/';
    normalized += component;
  }
  if (normalized.size() >= PATH_MAX) path.problem = {ENAMETOOLONG, "its path is too long"};
  if (normalized.empty() && !path.isDirectory) path.problem = {EINVAL, "it has no name"};
  if (!path.problem) path.normalized = std::move(normalized);
  return path;
}

}  // namespace ArcCopierImplementation
