#include "MarletDiff/Tokens.h"

#include <algorithm>
#include <array>
#include <bit>
#include <cstring>
#include <optional>
#include <random>

#ifdef __SSE2__
#include <emmintrin.h>
#endif

#include "MarletDiff/Words.h"

namespace MarletDiff {
namespace {

/// Whether a line's end may start with a unit.
template <class Unit>
bool mayEndLine(Unit unit) {
  return endsLine(unit) || unit == paragraphSeparator<Unit>.front();
}

/// A bit for each of 64 units, the first in the lowest, set where one may end a line.
template <class Unit>
std::uint64_t lineEnds(const Unit* units) {
  std::uint64_t ends = 0;
#ifdef __SSE2__
  const auto found = [&](int offset) {
    const auto block = _mm_loadu_si128(reinterpret_cast<const __m128i*>(units + offset));
    const auto is = [&](Unit end) {
      if constexpr (sizeof(Unit) == 1) return _mm_cmpeq_epi8(block, _mm_set1_epi8(end));
      return _mm_cmpeq_epi16(block, _mm_set1_epi16(static_cast<short>(end)));
    };
    return _mm_or_si128(_mm_or_si128(is('\n'), is('\r')), is(paragraphSeparator<Unit>.front()));
  };
  for (int i = 0; i < 64; i += 16) {
    const auto bytes = sizeof(Unit) == 1 ? found(i) : _mm_packs_epi16(found(i), found(i + 8));
    ends |= std::uint64_t{static_cast<unsigned>(_mm_movemask_epi8(bytes))} << i;
  }
#else
  for (int i = 0; i < 64; ++i) ends |= std::uint64_t{mayEndLine(units[i])} << i;
#endif
  return ends;
}

/// Not by the traits of its characters, which compare them one by one.
template <class Unit>
bool equal(View<Unit> a, View<Unit> b) {
  return a.size() == b.size() && std::memcmp(a.data(), b.data(), a.size() * sizeof(Unit)) == 0;
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

/// Token starts on their way to a list. Each is written to a block, but counted only where one is: a processor can't
/// foresee which are.
class StartsWriter {
 public:
  explicit StartsWriter(std::pmr::vector<std::uint32_t>& starts) : starts_(starts) {}
  void add(std::uint32_t place, bool isStart = true) {
    block_[count_] = place;
    count_ += isStart;
    if (count_ == block_.size()) flush();
  }
  void flush() {
    starts_.insert(starts_.end(), block_.begin(), block_.begin() + count_);
    count_ = 0;
  }

 private:
  std::pmr::vector<std::uint32_t>& starts_;
  std::array<std::uint32_t, 256> block_;
  std::size_t count_ = 0;
};

/// Calls `use` with each place behind a line's end, and with some that turn out to be none.
template <class Unit, class Use>
void forEachLineEnd(View<Unit> text, std::uint32_t start, std::uint32_t end, const Use& use) {
  const auto endAt = [&](std::uint32_t at) {
    const auto rest = text.substr(at, end - at);
    if (rest.front() == '\n') {
      use(at + 1, true);
    } else if (rest.front() == '\r') {
      use(at + 1, rest.size() == 1 || rest[1] != '\n');
    } else if (rest.starts_with(paragraphSeparator<Unit>)) {
      use(at + static_cast<std::uint32_t>(paragraphSeparator<Unit>.size()), true);
    }
  };
  auto at = start;
  for (; at + 64 <= end; at += 64) {
    for (auto ends = lineEnds(text.data() + at); ends != 0; ends &= ends - 1) {
      endAt(at + static_cast<std::uint32_t>(std::countr_zero(ends)));
    }
  }
  for (; at < end; ++at) {
    if (mayEndLine(text[at])) endAt(at);
  }
}

/// Eight units as bytes; nothing unless all are ASCII.
std::optional<std::uint64_t> asciiBytes(const char* units) {
  std::uint64_t bytes;
  std::memcpy(&bytes, units, sizeof bytes);
  return (bytes & 0x8080808080808080) == 0 ? std::optional(bytes) : std::nullopt;
}
std::optional<std::uint64_t> asciiBytes(const char16_t* units) {
  std::uint64_t bytes = 0, allBits = 0;
  for (int i = 0; i < 8; ++i) {
    bytes |= std::uint64_t{units[i]} << 8 * i;
    allBits |= units[i];
  }
  return allBits < 0x80 ? std::optional(bytes) : std::nullopt;
}

/// Whether a place is one in so many that are chosen by nothing but the characters beside them, all ASCII.
template <std::uint64_t many, class Unit>
bool isOneIn(View<Unit> text, std::size_t at) {
  constexpr std::size_t beside = 8;
  if (at < beside || at + beside > text.size()) return false;
  const auto before = asciiBytes(text.data() + at - beside), after = asciiBytes(text.data() + at);
  return before && after && mixed(*before ^ hashConstants[0], *after ^ hashConstants[1]) % many == 0;
}

}  // namespace

template <class Unit>
void Tokens<Unit>::cutLines(std::uint32_t start, std::uint32_t end) {
  starts.assign(1, start);
  StartsWriter writer(starts);
  forEachLineEnd(text, start, end, [&](std::uint32_t at, bool isEnd) { writer.add(at, isEnd); });
  writer.flush();
  if (starts.back() != end) starts.push_back(end);
}

template <class Unit>
void Tokens<Unit>::cutBlocks(std::uint32_t start, std::uint32_t end) {
  starts.assign(1, start);
  forEachLineEnd(text, start, end, [&](std::uint32_t at, bool isEnd) {
    if (isEnd && isOneIn<8>(text.substr(start, end - start), at - start)) starts.push_back(at);
  });
  starts.push_back(end);
}

template <class Unit>
void Tokens<Unit>::cutStretches(std::uint32_t start, std::uint32_t end) {
  starts.assign(1, start);
  for (auto at = start + 1; at < end; ++at) {
    if (!isASCIIWord(text[at]) || isASCIIWord(text[at - 1])) continue;
    if (isOneIn<16>(text.substr(start, end - start), at - start)) starts.push_back(at);
  }
  starts.push_back(end);
}

template <class Unit>
void Tokens<Unit>::cutWords(Characters<Unit>& characters, std::uint32_t start, std::uint32_t end) {
  starts.clear();
  StartsWriter writer(starts);
  writer.add(start, start < end);
  for (auto at = start + 1; at < end; ++at) {
    writer.add(at, !wordSpans(text, at) && characters.startAt(at));
  }
  writer.flush();
  starts.push_back(end);
}

template <class Unit>
void Tokens<Unit>::cutCharacters(Characters<Unit>& characters, std::uint32_t start, std::uint32_t end) {
  starts.clear();
  for (auto at = start; at < end; ++at) {
    if (at == start || characters.startAt(at)) starts.push_back(at);
  }
  starts.push_back(end);
}

template <class Unit>
void TokenNumbers<Unit>::number(Tokens<Unit>& original, Tokens<Unit>& modified) {
  reset(original.count());
  numberOriginal(original);
  numberModified(modified, original);
}

template <class Unit>
void TokenNumbers<Unit>::reset(std::size_t tokens) {
  mask_ = std::bit_ceil(2 * tokens + 1) - 1;
  if (slots_.size() <= mask_) slots_.resize(mask_ + 1);
  std::fill_n(slots_.begin(), mask_ + 1, Slot{});
  firstPlaces_.clear();
  firstPlaces_.reserve(tokens);
}

/// Hashes run ahead of the look-ups, and fetch the memory that these need.
template <class Unit>
void TokenNumbers<Unit>::numberOriginal(Tokens<Unit>& original) {
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
template <class Unit>
void TokenNumbers<Unit>::numberModified(Tokens<Unit>& modified, const Tokens<Unit>& original) {
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

template <class Unit>
typename TokenNumbers<Unit>::Slot& TokenNumbers<Unit>::slot(View<Unit> token, std::uint64_t hash,
                                                            const Tokens<Unit>& original) {
  const auto hashBits = static_cast<std::uint32_t>(hash >> 32);
  for (auto place = hash & mask_;; place = (place + 1) & mask_) {
    auto& slot = slots_[place];
    if (slot.number == 0) return slot;
    if (slot.hashBits == hashBits && equal(original[firstPlaces_[slot.number - 1]], token)) return slot;
  }
}

template <class Unit>
std::uint64_t TokenNumbers<Unit>::hash(View<Unit> token) {
  const auto* bytes = reinterpret_cast<const char*>(token.data());
  const auto size = token.size() * sizeof(Unit);
  std::uint64_t result = seed ^ size;
  std::uint64_t words[2] = {0, 0};
  const auto mix = [&] { result = mixed(words[0] ^ hashConstants[0] ^ result, words[1] ^ hashConstants[1]); };
  std::size_t at = 0;
  // A block of lines is long, and four chains of products take little longer than one.
  if (size > 256) {
    std::uint64_t results[] = {result, result + 1, result + 2, result + 3};
    for (; at + 4 * sizeof words < size; at += 4 * sizeof words) {
      for (std::size_t lane = 0; lane < 4; ++lane) {
        std::memcpy(words, bytes + at + lane * sizeof words, sizeof words);
        results[lane] = mixed(words[0] ^ hashConstants[0] ^ results[lane], words[1] ^ hashConstants[1]);
      }
    }
    result =
        mixed(results[0] ^ results[1], hashConstants[0]) ^ mixed(results[2] ^ results[3], hashConstants[1]);
  }
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

template struct Tokens<char>;
template struct Tokens<char16_t>;
template class TokenNumbers<char>;
template class TokenNumbers<char16_t>;

}  // namespace MarletDiff
