#include "MarletFoundation/PathUtilities/PathUniquifier.h"

#include <cstdint>

#include "MarletFoundation/PathUtilities/DocumentPath.h"
#include "MarletFoundation/Platform/Digest.h"
#include "MarletFoundation/Platform/Error.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t LettersPerHalf = 14;

/// The lowest 14 digits of eight bytes, taken as one big-endian number, in base 26 with the letters a to z.
std::string letters(std::span<const std::uint8_t, 8> bytes) {
  std::uint64_t number = 0;
  for (const auto byte : bytes) number = number << 8 | byte;
  std::string text(LettersPerHalf, 'a');
  for (auto digit = text.rbegin(); digit != text.rend(); ++digit, number /= 26) {
    *digit = static_cast<char>('a' + number % 26);
  }
  return text;
}

/// Whether the URL is the documents directory or lies in it; not when that can't be told.
bool liesInDocuments(const std::optional<URL>& documents, const URL& url) {
  try {
    return documents && FileManager::relationship(*documents, url) != FileManager::Relationship::other;
  } catch (const Error&) {
    return false;
  }
}

}  // namespace

std::string mlf_uniqueStringWithDistinguishingStrings(std::span<const std::string> strings) {
  MD5 digest;
  for (const auto& string : strings) digest.update(string);
  const auto bytes = digest.final();
  const std::span<const std::uint8_t, 16> all(bytes);
  return letters(all.first<8>()) + letters(all.last<8>());
}

std::string pathUniquifier(const URL& url) {
  auto distinguishing = url.path();
  if (distinguishing.empty()) fatalError("URLs must have a path to have a pathUniquifier!");
  const auto documents = FileManager::documentsDirectory();
  if (liesInDocuments(documents, url)) {
    distinguishing = "LocalDocuments/" + joinedWithoutCommonStart(url.resolvingSymlinksInPath(), *documents);
  }
  return mlf_uniqueStringWithDistinguishingStrings({&distinguishing, 1});
}

}  // namespace MarletFoundation
