#pragma once

#include <cstdint>
#include <memory_resource>
#include <string_view>
#include <vector>

#include "MarletDiff/Characters.h"

namespace MarletDiff {

/// A stretch of a text, cut into tokens.
template <class Unit>
struct Tokens {
  explicit Tokens(std::pmr::memory_resource* memory) : starts(memory), numbers(memory) {}

  View<Unit> text;
  /// Where the tokens start, and behind the last one where it ends.
  std::pmr::vector<std::uint32_t> starts;
  std::pmr::vector<std::uint32_t> numbers;

  std::uint32_t count() const { return static_cast<std::uint32_t>(starts.size()) - 1; }
  View<Unit> operator[](std::size_t index) const {
    return text.substr(starts[index], starts[index + 1] - starts[index]);
  }

  /// Cuts into lines with their ends.
  void cutLines(std::uint32_t start, std::uint32_t end);
  /// Cuts into blocks of a few lines, or stretches of about 16 words. Where one starts depends on nothing but the
  /// characters beside that place, all ASCII, so that equal texts are cut alike wherever they stand and whatever
  /// their encoding.
  void cutBlocks(std::uint32_t start, std::uint32_t end);
  void cutStretches(std::uint32_t start, std::uint32_t end);
  /// Cuts into words, and every other character by itself.
  void cutWords(Characters<Unit>& characters, std::uint32_t start, std::uint32_t end);
  void cutCharacters(Characters<Unit>& characters, std::uint32_t start, std::uint32_t end);
};

/// Gives tokens numbers, the same to equal ones. Tokens are found by a hash and compared for real. An object may
/// be used again; it keeps its memory.
template <class Unit>
class TokenNumbers {
 public:
  explicit TokenNumbers(std::pmr::memory_resource* memory) : slots_(memory), firstPlaces_(memory) {}

  /// Numbers those of the original from 0 on, in the order in which they come first; what of the modified text
  /// isn't among them is `size()`.
  void number(Tokens<Unit>& original, Tokens<Unit>& modified);
  std::uint32_t size() const { return static_cast<std::uint32_t>(firstPlaces_.size()); }

 private:
  /// A hash table with open addressing: numbers plus 1, 0 where free, beside some bits of the hash.
  struct Slot {
    std::uint32_t hashBits;
    std::uint32_t number;
  };

  static std::uint64_t hash(View<Unit> token);
  void reset(std::size_t tokens);
  void numberOriginal(Tokens<Unit>& original);
  void numberModified(Tokens<Unit>& modified, const Tokens<Unit>& original);
  /// The slot of a token of that hash, or the free one where it belongs.
  Slot& slot(View<Unit> token, std::uint64_t hash, const Tokens<Unit>& original);

  std::pmr::vector<Slot> slots_;
  std::size_t mask_ = 0;
  /// Where in the original each number comes first.
  std::pmr::vector<std::uint32_t> firstPlaces_;
};

}  // namespace MarletDiff
