#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include "MarletDiff/Characters.h"

namespace MarletDiff {

/// Where the tokens of a stretch of text start, and behind the last one where it ends.
using TokenStarts = std::vector<std::uint32_t>;

/// Lines with their ends.
void cutLines(std::u16string_view text, std::uint32_t start, std::uint32_t end, TokenStarts& tokens);
/// Words, and every other character by itself.
void cutWords(std::u16string_view text, Characters& characters, std::uint32_t start, std::uint32_t end,
              TokenStarts& tokens);
void cutCharacters(Characters& characters, std::uint32_t start, std::uint32_t end, TokenStarts& tokens);

/// Gives tokens numbers, the same to equal ones, counted from 0 in the order in which they come first. Tokens
/// are found by a hash and compared for real.
class TokenNumbers {
 public:
  /// Forgets all tokens and makes room for as many.
  void reset(std::size_t tokens);
  std::uint32_t number(std::u16string_view token) { return number(token, hash(token)); }
  /// The same in two steps, for many tokens: between them, the memory for the second is fetched.
  std::uint64_t prepare(std::u16string_view token) const;
  std::uint32_t number(std::u16string_view token, std::uint64_t prepared);
  std::size_t size() const { return known_.size(); }

 private:
  static std::uint64_t hash(std::u16string_view token);

  std::vector<std::u16string_view> known_;
  /// A hash table with open addressing: numbers plus 1, 0 where free, beside some bits of the hash.
  struct Slot {
    std::uint32_t hashBits;
    std::uint32_t number;
  };
  std::vector<Slot> slots_;
  std::size_t mask_ = 0;
};

}  // namespace MarletDiff
