#include "MarletFoundation/Platform/RegularExpression.h"

#include <unicode/uregex.h>

#include <limits>

#include "MarletFoundation/Platform/ErrorObject.h"

namespace MarletFoundation {
namespace {

constexpr std::int32_t stackLimitInBytes = 8 << 20;

struct Closer {
  void operator()(URegularExpression* expression) const { uregex_close(expression); }
};
using Engine = std::unique_ptr<URegularExpression, Closer>;

/// The engine counts its work in ticks of ten thousand steps. A sound pattern takes a few steps for each
/// unit of text; one that backtracks without end is stopped after a fraction of a second.
std::int32_t timeLimit(std::size_t units) { return 200 + static_cast<std::int32_t>(units / 500); }

RegularExpression::Match currentMatch(URegularExpression* engine, std::int32_t groupCount) {
  RegularExpression::Match match;
  match.reserve(static_cast<std::size_t>(groupCount) + 1);
  for (std::int32_t group = 0; group <= groupCount; ++group) {
    UErrorCode status = U_ZERO_ERROR;
    const auto start = uregex_start(engine, group, &status);
    const auto end = uregex_end(engine, group, &status);
    match.push_back(start < 0 ? TextRange{NotFound, 0} : TextRange{start, end - start});
  }
  return match;
}

}  // namespace

struct RegularExpression::Compiled {
  Engine engine;
  std::int32_t groupCount = 0;

  /// Calls `use` for match after match until it answers false. An engine carries the state of one search, so
  /// each search has a clone, which shares the compiled pattern.
  template <class Use>
  void forEachMatch(std::u16string_view text, const Use& use) const {
    if (text.size() > std::numeric_limits<std::int32_t>::max()) return;
    UErrorCode status = U_ZERO_ERROR;
    const Engine search(uregex_clone(engine.get(), &status));
    uregex_setStackLimit(search.get(), stackLimitInBytes, &status);
    uregex_setTimeLimit(search.get(), timeLimit(text.size()), &status);
    uregex_setText(search.get(), text.data() ? text.data() : u"", static_cast<std::int32_t>(text.size()),
                   &status);
    while (uregex_findNext(search.get(), &status) && U_SUCCESS(status)) {
      if (!use(currentMatch(search.get(), groupCount))) return;
    }
  }
};

RegularExpression::RegularExpression(std::u16string_view pattern) {
  UParseError place{};
  UErrorCode status = U_ZERO_ERROR;
  Engine engine(uregex_open(pattern.data(), static_cast<std::int32_t>(pattern.size()), 0, &place, &status));
  const auto groupCount = uregex_groupCount(engine.get(), &status);
  if (U_FAILURE(status)) {
    throw ErrorObject::withMessage("RegularExpression", status,
                                   std::string("The pattern doesn't compile: ") + u_errorName(status) +
                                       " at line " + std::to_string(place.line) + ", offset " +
                                       std::to_string(place.offset) + ".");
  }
  compiled_ = std::make_shared<const Compiled>(Compiled{std::move(engine), groupCount});
}

std::optional<RegularExpression::Match> RegularExpression::firstMatch(std::u16string_view text) const {
  std::optional<Match> first;
  compiled_->forEachMatch(text, [&](Match match) {
    first = std::move(match);
    return false;
  });
  return first;
}

std::vector<RegularExpression::Match> RegularExpression::matches(std::u16string_view text) const {
  std::vector<Match> all;
  compiled_->forEachMatch(text, [&](Match match) {
    all.push_back(std::move(match));
    return true;
  });
  return all;
}

}  // namespace MarletFoundation
