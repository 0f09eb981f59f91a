#include "MarletFoundation/Utils/Continuation.h"

#include <gtest/gtest.h>

#include <atomic>
#include <list>
#include <thread>

#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/SourceEditor/CodeCompletionResponder.h"
#include "MarletFoundation/SourceEditor/CodeTokenType.h"
#include "MarletFoundation/Utils/ClosureActionTarget.h"
#include "MarletFoundation/Utils/ContinuationScheduler.h"
#include "MarletFoundation/Utils/TimeoutContinuation.h"

namespace MarletFoundation::test {
namespace {

using Work = Continuation<Unit>;

TEST(Continuation, ChainsAndStopsAtTheFirstFailure) {
  std::string ran;
  const auto step = [&](char name) {
    return Continuation<int>([&ran, name] {
      ran += name;
      return int{name};
    });
  };
  const auto failing = Continuation<int>::fail().flatMap([&](int) { return step('x'); });
  EXPECT_EQ(failing.run(), std::nullopt);
  EXPECT_EQ(sequence<int>({step('a'), Continuation<int>::fail(), step('c')}).run(), std::nullopt);
  EXPECT_EQ(ran, "a");
  EXPECT_EQ(sequence<int>({step('p'), step('q')}).run(), (std::vector<int>{'p', 'q'}));
  EXPECT_EQ(sequence<int>({}).run(), std::vector<int>());
  EXPECT_TRUE(sequence_<int>({}).run());
}

TEST(Continuation, LongChainsOfAnyKindTakeNoStack) {
  constexpr int length = 50000;
  int ran = 0;
  const auto count = [&ran] { return ++ran, Unit(); };
  auto behind = Continuation<int>([] { return 0; });
  auto within = Work(count), listed = Work(count),
       failing = Work::fail().flatMap([](Unit) { return Work::nothing(); });
  for (int i = 0; i < length; ++i) {
    behind = behind.flatMap([](int value) { return Continuation<int>([=] { return value + 1; }); });
    within = Work(count).flatMap([within](Unit) { return within; });
    listed = sequence_<Unit>({listed, Work(count)});
    failing = failing.flatMap([](Unit) { return Work::nothing(); });
  }
  EXPECT_EQ(behind.run(), length);
  EXPECT_EQ(behind.run(), length) << "each run runs the work anew";
  EXPECT_TRUE(within.run());
  EXPECT_TRUE(listed.run());
  EXPECT_EQ(ran, 2 * (length + 1));
  EXPECT_FALSE(failing.run());
}

/// Of two threads that drop their copies at once, the last frees what both have read.
TEST(Continuation, CopiesAreDroppedOnSeveralThreads) {
  for (int round = 0; round < 200; ++round) {
    auto type = CodeTokenType::placeholder(CodeTokenType::Kind::Keyword);
    auto work = Continuation<int>([] { return 0; });
    for (int i = 0; i < 20; ++i) {
      type = CodeTokenType::placeholder(type);
      work = work.flatMap([](int value) { return Continuation<int>([=] { return value + 1; }); });
    }
    const auto use = [](const auto& ofType, const auto& ofWork) {
      EXPECT_TRUE(ofType.held()->held());
      EXPECT_EQ(ofWork.run(), 20);
    };
    std::thread other([use, type, work] { use(type, work); });
    use(std::exchange(type, CodeTokenType::Kind::Keyword), std::exchange(work, Continuation<int>::fail()));
    other.join();
  }
}

TEST(Continuation, SubmissionRunsAFunctionAndWhatItYields) {
  std::atomic<int> ran = 0;
  asyncio([&] { ran += isMainThread() ? 0 : 1; });
  asyncio([&] { return Work([&] { return ran += isMainThread() ? 0 : 2, Unit(); }); });
  mainthreadio([&] { ran += isMainThread() ? 4 : 0; });
  mainthreadio([&] { return Work([&] { return ran += isMainThread() ? 8 : 0, Unit(); }); });
  EXPECT_TRUE(runUntil([&] { return ran == 15; }, 10)) << ran;
}

TEST(Continuation, SchedulerRunsTheLastOfAName) {
  std::string ran;
  ContinuationScheduler scheduler(true);
  scheduler.scheduleContinuationWithName("one", [&] { ran += 'a'; });
  scheduler.scheduleContinuationWithName("one", [&] {
    ran += 'b';
    scheduler.scheduleContinuationWithName("one", [&] { ran += 'c'; });
  });
  scheduler.scheduleMainAsyncContinuationWithName("two", [&] { ran += 'd'; });
  EXPECT_EQ(ran, "");
  EXPECT_TRUE(runUntil([&] { return ran == "bdc" || ran == "bcd"; }, 10)) << ran;
}

TEST(ClosureActionTarget, IsPerformedByItsSelector) {
  std::string heard;
  const ClosureActionTarget target(
      [&](const auto& sender) { heard += dynamic_cast<const StringObject&>(*sender).value; });
  (target.*ClosureActionTarget::actionSelector)(std::make_shared<StringObject>("sender"));
  EXPECT_EQ(heard, "sender");
}

TEST(Continuation, TimeoutFiresOnceAfterTheLastReset) {
  int fired = 0;
  TimeoutContinuation timeout(0.05, [&] { ++fired; });
  timeout.resetTimeout();
  timeout.cancel();
  runUntil([] { return false; }, 0.1);
  EXPECT_EQ(fired, 0);
  timeout.resetTimeout();
  timeout.resetTimeout();
  EXPECT_TRUE(runUntil([&] { return fired == 1; }, 10));
  runUntil([] { return false; }, 0.1);
  EXPECT_EQ(fired, 1);
  std::make_unique<TimeoutContinuation>(0.01, [&] { ++fired; })->resetTimeout();
  runUntil([] { return false; }, 0.1);
  EXPECT_EQ(fired, 1);
}

struct Line final : SourceEditorCodeCompletionSuggestion {
  std::string text;
  explicit Line(std::string t) : text(std::move(t)) {}
};

/// A range that makes its suggestions as it is walked, and ends at a value of another type.
struct Lines {
  struct End {};
  int next = 1;
  Lines& begin() { return *this; }
  End end() { return {}; }
  bool operator!=(End) const { return next <= 3; }
  Line operator*() const { return Line(std::to_string(next)); }
  void operator++() { ++next; }
};

struct Editor final : SourceEditorCodeCompletionDelegate {
  std::string heard;
  std::int64_t maxCompletions() const override { return 7; }
  Work suggestionsOffered(const SourceEditorCodeCompletionSuggestions& suggestions, const std::string& token,
                          bool definitive) override {
    heard +=
        token + std::to_string(suggestions.size()) + (definitive ? "!" : "?") + (isMainThread() ? "m" : "");
    for (const auto& suggestion : suggestions)
      if (const auto* line = dynamic_cast<const Line*>(suggestion.get())) heard += "'" + line->text + "'";
    return Work([this] { return heard += ".", Unit(); });
  }
  Work completionUnavailable(const std::string& token) override {
    heard += token + "-";
    return Work::nothing();
  }
};

TEST(CodeCompletion, RelevanceHasItsRawValue) {
  for (std::int64_t rawValue = -1; rawValue <= 6; ++rawValue) {
    const bool exists = rawValue >= 0 && rawValue <= 5;
    EXPECT_EQ(
        relevanceFromRawValue(rawValue),
        exists ? std::optional(static_cast<SourceEditorCodeCompletionRelevance>(rawValue)) : std::nullopt);
  }
}

TEST(CodeCompletionResponder, AnswersOnTheMainThreadAndIsSilentWhenTheRequesterIsGone) {
  auto editor = std::make_shared<Editor>();
  const SourceEditorCodeCompletionResponder responder("T", editor);
  EXPECT_EQ(responder.maxCompletions(), 7);
  responder.offerSuggestions(SourceEditorCodeCompletionSuggestions(9));
  std::thread([&] {
    responder.offerSuggestions(SourceEditorCodeCompletionSuggestions(2), true).run();
    responder.offerSuggestions(Lines()).run();
    responder.offerSuggestions(std::list{std::make_shared<Line>("lent")}).run();
    responder.completionUnavailable().run();
  }).join();
  EXPECT_EQ(editor->heard, "");
  EXPECT_TRUE(runUntil([&] { return editor->heard.ends_with('-'); }, 10));
  EXPECT_EQ(editor->heard, "T2!m.T3?m'1''2''3'.T1?m'lent'.T-");
  editor.reset();
  EXPECT_EQ(responder.maxCompletions(), 0);
  EXPECT_TRUE(responder.completionUnavailable().run());
  EXPECT_TRUE(responder.offerSuggestions(SourceEditorCodeCompletionSuggestions(1), true).run());
  runUntil([] { return false; }, 0.02);
}

}  // namespace
}  // namespace MarletFoundation::test
