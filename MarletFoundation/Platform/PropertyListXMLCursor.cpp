#include "MarletFoundation/Platform/PropertyListXMLCursor.h"

#include <algorithm>
#include <bit>
#include <cstdint>

namespace MarletFoundation {
namespace {

using enum PropertyListErrorCode;

bool endsName(char c) {
  return PropertyListXMLCursor::isBlank(c) || c == '>' || c == '/' || c == '=' || c == '<';
}

bool isNameCharacter(char c) {
  const bool isLetter = (c | 0x20) >= 'a' && (c | 0x20) <= 'z';
  return isLetter || (c >= '0' && c <= '9') || c == '_' || c == '-' || c == '.' || c == ':' ||
         static_cast<unsigned char>(c) > 0x7F;
}

}  // namespace

const char* PropertyListXMLCursor::find(char character, const char* from) const {
  // What is looked for mostly lies near: a few words are searched here, which costs less than a call.
  constexpr std::uint64_t ones = 0x0101010101010101;
  const auto pattern = ones * static_cast<unsigned char>(character);
  const char* const near = end_ - from > 32 ? from + 24 : from;
  for (; from < near; from += 8) {
    std::uint64_t word;
    std::memcpy(&word, from, sizeof word);
    word ^= pattern;
    const auto zeros = (word - ones) & ~word & (ones << 7);
    if (zeros != 0 && std::endian::native == std::endian::little) return from + std::countr_zero(zeros) / 8;
    if (zeros != 0) break;
  }
  if (from == end_) return end_;
  const auto* found =
      static_cast<const char*>(std::memchr(from, character, static_cast<std::size_t>(end_ - from)));
  if (!found) found = end_;
  searched_ += static_cast<std::size_t>(found - from);
  return found;
}

std::string_view PropertyListXMLCursor::readName() {
  const char* const start = place_;
  while (place_ < end_ && !endsName(*place_)) ++place_;
  return from(start);
}

bool PropertyListXMLCursor::skipAttributes(const char* tag) {
  while (true) {
    const char* const before = place_;
    skipBlanks();
    if (accept(">")) return false;
    if (accept("/>")) return true;
    if (isAtEnd()) fail(unexpectedEnd, end_);
    const auto name = readName();
    if (name.empty() || before == name.data()) fail(malformedMarkup, tag);
    skipBlanks();
    if (!accept("=")) fail(malformedMarkup, tag);
    skipBlanks();
    const char* const value = place_;
    skipQuoted();
    if (std::find(value, place_, '<') != place_) fail(malformedMarkup, tag);
  }
}

void PropertyListXMLCursor::skipDeclaration() {
  if (rest().size() > 5 && startsWith("<?xml", place_) && isBlank(place_[5])) skipPast("?>", place_);
}

void PropertyListXMLCursor::skipComment() {
  const char* const start = place_;
  place_ += 4;
  skipPast("--", start);
  if (!accept(">")) fail(malformedMarkup, start, "two hyphens in a comment");
}

void PropertyListXMLCursor::skipInstruction() {
  const char* const start = place_;
  place_ += 2;
  const char* const target = place_;
  while (place_ < end_ && isNameCharacter(*place_)) ++place_;
  const auto length = place_ - target;
  const bool isReserved =
      length == 3 && (target[0] | 0x20) == 'x' && (target[1] | 0x20) == 'm' && (target[2] | 0x20) == 'l';
  const bool isEnded = !isAtEnd() && (isBlank(*place_) || *place_ == '?');
  if (length == 0 || isReserved || !isEnded) fail(malformedMarkup, start);
  skipPast("?>", start);
}

void PropertyListXMLCursor::skipDocumentType() {
  const char* const start = place_;
  place_ += 9;
  const char* const blanks = place_;
  skipBlanks();
  if (place_ == blanks || readName().empty()) fail(malformedMarkup, start);
  skipBlanks();
  const bool isPublic = accept("PUBLIC");
  if (isPublic || accept("SYSTEM")) {
    skipBlanks();
    skipQuoted();
    skipBlanks();
    if (isPublic) skipQuoted();
    skipBlanks();
  }
  if (next() == '[') fail(entityDeclaration, start);
  if (!accept(">")) fail(malformedMarkup, start);
}

void PropertyListXMLCursor::skipQuoted() {
  const char* const start = place_;
  if (next() != '"' && next() != '\'') fail(malformedMarkup, start);
  ++place_;
  skipPast({start, 1}, start);
}

void PropertyListXMLCursor::skipPast(std::string_view text, const char* start) {
  const auto found = rest().find(text);
  if (found == std::string_view::npos) fail(unexpectedEnd, start);
  place_ += found + text.size();
}

void PropertyListXMLCursor::fail(PropertyListErrorCode code, const char* where,
                                 std::string_view detail) const {
  const auto line = 1 + static_cast<std::size_t>(std::count(begin_, where, '\n'));
  constexpr std::size_t longest = 40;
  std::string shown(detail);
  if (shown.size() > longest) {
    // Not within a character.
    auto end = longest;
    while ((shown[end] & 0xC0) == 0x80) --end;
    shown.resize(end);
    shown += "...";
  }
  throw propertyListError(code, shown, document_.documentOffset(static_cast<std::size_t>(where - begin_)),
                          line);
}

}  // namespace MarletFoundation
