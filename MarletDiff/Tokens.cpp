#include "MarletDiff/Tokens.h"

#include <algorithm>
#include <bit>
#include <cstring>
#include <random>

namespace MarletDiff {
namespace {

/// The offset of the first unit from `at` on that ends a line, or `end`.
std::size_t lineEnd(std::u16string_view text, std::size_t at, std::size_t end) {
  using Block = char16_t __attribute__((vector_size(16)));
  constexpr std::size_t unitsPerBlock = sizeof(Block) / sizeof(char16_t);
  for (; at + unitsPerBlock <= end; at += unitsPerBlock) {
    Block block;
    std::memcpy(&block, text.data() + at, sizeof block);
    const auto found = (block == u'\n') | (block == u'\r') | (block == ParagraphSeparator);
    std::uint64_t halves[2];
    std::memcpy(halves, &found, sizeof halves);
    if (halves[0]) return at + static_cast<std::size_t>(std::countr_zero(halves[0])) / 16;
    if (halves[1]) return at + 4 + static_cast<std::size_t>(std::countr_zero(halves[1])) / 16;
  }
  while (at < end && !endsLine(text[at])) ++at;
  return at;
}

/// Another number in each process, so that no text can be made to put all its tokens in one slot. Numbers
/// don't depend on it.
const std::uint64_t seed = [] {
  std::random_device device;
  return (std::uint64_t{device()} << 32 | device()) | 1;
}();

std::uint64_t mixed(std::uint64_t a, std::uint64_t b) {
  __extension__ using Wide = unsigned __int128;
  const Wide product = static_cast<Wide>(a) * b;
  return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
}

}  // namespace

void cutLines(std::u16string_view text, std::uint32_t start, std::uint32_t end, TokenStarts& tokens) {
  tokens.clear();
  for (std::size_t at = start; at < end;) {
    tokens.push_back(static_cast<std::uint32_t>(at));
    at = lineEnd(text, at, end);
    if (at < end) at += text.substr(at, 2) == u"\r\n" ? 2 : 1;
  }
  tokens.push_back(end);
}

void cutWords(std::u16string_view text, Characters& characters, std::uint32_t start, std::uint32_t end,
              TokenStarts& tokens) {
  tokens.clear();
  bool inWord = false;
  for (auto at = start; at < end; ++at) {
    if (at != start && !characters.startAt(at)) continue;
    const bool isWord = isWordUnit(text[at]);
    if (!isWord || !inWord) tokens.push_back(at);
    inWord = isWord;
  }
  tokens.push_back(end);
}

void cutCharacters(Characters& characters, std::uint32_t start, std::uint32_t end, TokenStarts& tokens) {
  tokens.clear();
  for (auto at = start; at < end; ++at) {
    if (at == start || characters.startAt(at)) tokens.push_back(at);
  }
  tokens.push_back(end);
}

void TokenNumbers::reset(std::size_t tokens) {
  mask_ = std::bit_ceil(2 * tokens + 1) - 1;
  if (slots_.size() <= mask_) slots_.resize(mask_ + 1);
  std::fill_n(slots_.begin(), mask_ + 1, Slot{});
  known_.clear();
}

std::uint64_t TokenNumbers::hash(std::u16string_view token) {
  constexpr std::uint64_t first = 0x9E3779B97F4A7C15, second = 0xC2B2AE3D27D4EB4F;
  const auto* bytes = reinterpret_cast<const char*>(token.data());
  auto size = token.size() * sizeof(char16_t);
  std::uint64_t result = seed ^ size;
  std::uint64_t words[2];
  for (; size > sizeof words; bytes += sizeof words, size -= sizeof words) {
    std::memcpy(words, bytes, sizeof words);
    result = mixed(words[0] ^ first ^ result, words[1] ^ second);
  }
  words[0] = words[1] = 0;
  std::memcpy(words, bytes, size);
  return mixed(words[0] ^ first ^ result, words[1] ^ second ^ seed);
}

std::uint64_t TokenNumbers::prepare(std::u16string_view token) const {
  const auto tokenHash = hash(token);
  __builtin_prefetch(&slots_[tokenHash & mask_], 1);
  return tokenHash;
}

std::uint32_t TokenNumbers::number(std::u16string_view token, std::uint64_t tokenHash) {
  const auto hashBits = static_cast<std::uint32_t>(tokenHash >> 32);
  for (auto place = tokenHash & mask_;; place = (place + 1) & mask_) {
    auto& slot = slots_[place];
    if (slot.number == 0) {
      known_.push_back(token);
      slot = {hashBits, static_cast<std::uint32_t>(known_.size())};
      return slot.number - 1;
    }
    if (slot.hashBits == hashBits && known_[slot.number - 1] == token) return slot.number - 1;
  }
}

}  // namespace MarletDiff
