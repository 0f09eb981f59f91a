#include "MarletDiff/Tokens.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <random>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

namespace MarletDiff {
namespace {

/// A bit for each of 64 units, the first in the lowest, set where one ends a line.
std::uint64_t lineEnds(const char16_t* units) {
  std::uint64_t ends = 0;
#ifdef __SSE2__
  const auto found = [&](int offset) {
    const auto block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(units + offset));
    const auto is = [&](char16_t end) {
      return _mm_cmpeq_epi16(block, _mm_set1_epi16(static_cast<short>(end)));
    };
    return _mm_or_si128(_mm_or_si128(is(u'\n'), is(u'\r')), is(ParagraphSeparator));
  };
  for (int i = 0; i < 64; i += 16) {
    const auto bits = static_cast<unsigned>(_mm_movemask_epi8(_mm_packs_epi16(found(i), found(i + 8))));
    ends |= std::uint64_t{bits} << i;
  }
#else
  for (int i = 0; i < 64; ++i) ends |= std::uint64_t{endsLine(units[i])} << i;
#endif
  return ends;
}

/// Not by the traits of its characters, which compare them one by one.
bool equal(std::u16string_view a, std::u16string_view b) {
  return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(char16_t)) == 0;
}

/// Another number in each process, so that no text can be made to put all its tokens in one slot. Numbers
/// don't depend on it.
const std::uint64_t seed = [] {
  std::random_device device;
  return (std::uint64_t{device()} << 32 | device()) | 1;
}();

constexpr std::uint64_t hashConstants[] = {0x9E3779B97F4A7C15, 0xC2B2AE3D27D4EB4F};

std::uint64_t mixed(std::uint64_t a, std::uint64_t b) {
  __extension__ using Wide = unsigned __int128;
  const Wide product = static_cast<Wide>(a) * b;
  return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64);
}

}  // namespace

void Tokens::cutLines(std::uint32_t start, std::uint32_t end) {
  starts.assign(1, start);
  const auto endAt = [&](std::uint32_t at) {
    const bool dividesPair = text[at] == u'\r' && at + 1 < end && text[at + 1] == u'\n';
    if (!dividesPair) starts.push_back(at + 1);
  };
  auto at = start;
  for (; at + 64 <= end; at += 64) {
    for (auto ends = lineEnds(text.data() + at); ends != 0; ends &= ends - 1) {
      endAt(at + static_cast<std::uint32_t>(std::countr_zero(ends)));
    }
  }
  for (; at < end; ++at) {
    if (endsLine(text[at])) endAt(at);
  }
  if (starts.back() != end) starts.push_back(end);
}

void Tokens::cutStretches(std::uint32_t start, std::uint32_t end) {
  constexpr std::uint32_t beside = 4;
  starts.assign(1, start);
  for (auto at = start + beside; at + beside <= end; ++at) {
    const char16_t before = text[at - 1], after = text[at];
    if (isWordUnit(before) || !isWordUnit(after) || after >= 0x80) continue;
    std::uint64_t left, right;
    std::memcpy(&left, &text[at - beside], sizeof left);
    std::memcpy(&right, &text[at], sizeof right);
    if (mixed(left ^ hashConstants[0], right ^ hashConstants[1]) % 16 == 0) starts.push_back(at);
  }
  starts.push_back(end);
}

void Tokens::cutWords(Characters& characters, std::uint32_t start, std::uint32_t end) {
  starts.clear();
  // Each place is written and counted only where a token starts: a processor can't foresee which do.
  std::array<std::uint32_t, 256> block;
  std::size_t count = 0;
  bool inWord = false;
  for (auto at = start; at < end; ++at) {
    const bool startsCharacter = at == start || characters.startAt(at);
    const bool isWord = isWordUnit(text[at]);
    block[count] = at;
    count += startsCharacter & !(isWord & inWord);
    inWord = startsCharacter ? isWord : inWord;
    if (count == block.size()) {
      starts.insert(starts.end(), block.begin(), block.end());
      count = 0;
    }
  }
  starts.insert(starts.end(), block.begin(), block.begin() + count);
  starts.push_back(end);
}

void Tokens::cutCharacters(Characters& characters, std::uint32_t start, std::uint32_t end) {
  starts.clear();
  for (auto at = start; at < end; ++at) {
    if (at == start || characters.startAt(at)) starts.push_back(at);
  }
  starts.push_back(end);
}

void TokenNumbers::number(Tokens& original, Tokens& modified) {
  reset(original.count());
  numberOriginal(original);
  numberModified(modified, original);
}

void TokenNumbers::reset(std::size_t tokens) {
  mask_ = std::bit_ceil(2 * tokens + 1) - 1;
  if (slots_.size() <= mask_) slots_.resize(mask_ + 1);
  std::fill_n(slots_.begin(), mask_ + 1, Slot{});
  firstPlaces_.clear();
}

/// Hashes run ahead of the look-ups, and fetch the memory that these need.
void TokenNumbers::numberOriginal(Tokens& original) {
  constexpr std::uint32_t ahead = 8;
  std::array<std::uint64_t, ahead> hashes;
  const auto count = original.count();
  original.numbers.resize(count);
  for (std::uint32_t i = 0; i < count + ahead; ++i) {
    auto& hashed = hashes[i % ahead];
    if (i >= ahead) {
      const auto place = i - ahead;
      auto& found = slot(original[place], hashed, original);
      if (found.number == 0) {
        firstPlaces_.push_back(place);
        found = {static_cast<std::uint32_t>(hashed >> 32), size()};
      }
      original.numbers[place] = found.number - 1;
    }
    if (i < count) {
      hashed = hash(original[i]);
      __builtin_prefetch(&slots_[hashed & mask_], 1);
    }
  }
}

/// Most tokens stand behind the same ones as in the original, so that place is tried before all others.
void TokenNumbers::numberModified(Tokens& modified, const Tokens& original) {
  modified.numbers.resize(modified.count());
  std::uint32_t expected = 0;
  for (std::uint32_t i = 0; i < modified.count(); ++i) {
    const auto token = modified[i];
    if (expected >= original.count() || !equal(original[expected], token)) {
      const auto found = slot(token, hash(token), original).number;
      modified.numbers[i] = found == 0 ? size() : found - 1;
      expected = (found == 0 ? expected : firstPlaces_[found - 1]) + 1;
    } else {
      modified.numbers[i] = original.numbers[expected++];
    }
  }
}

TokenNumbers::Slot& TokenNumbers::slot(std::u16string_view token, std::uint64_t hash,
                                       const Tokens& original) {
  const auto hashBits = static_cast<std::uint32_t>(hash >> 32);
  for (auto place = hash & mask_;; place = (place + 1) & mask_) {
    auto& slot = slots_[place];
    if (slot.number == 0) return slot;
    if (slot.hashBits == hashBits && equal(original[firstPlaces_[slot.number - 1]], token)) return slot;
  }
}

std::uint64_t TokenNumbers::hash(std::u16string_view token) {
  const auto* bytes = reinterpret_cast<const char*>(token.data());
  const auto size = token.size() * sizeof(char16_t);
  std::uint64_t result = seed ^ size;
  std::uint64_t words[2] = {0, 0};
  const auto mix = [&] { result = mixed(words[0] ^ hashConstants[0] ^ result, words[1] ^ hashConstants[1]); };
  std::size_t at = 0;
  for (; at + sizeof words < size; at += sizeof words) {
    std::memcpy(words, bytes + at, sizeof words);
    mix();
  }
  // The last words end where the token does, and may begin within what was mixed before.
  const auto* tail = bytes + size;
  if (size >= 16) {
    std::memcpy(words, tail - 16, 16);
  } else if (size >= 8) {
    std::memcpy(&words[0], bytes, 8), std::memcpy(&words[1], tail - 8, 8);
  } else if (size >= 4) {
    std::memcpy(&words[0], bytes, 4), std::memcpy(&words[1], tail - 4, 4);
  } else {
    std::memcpy(words, bytes, size);
  }
  mix();
  return result;
}

}  // namespace MarletDiff
