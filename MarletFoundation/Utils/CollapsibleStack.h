#pragma once

#include <functional>
#include <iterator>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

#include "MarletFoundation/Platform/SharedRelease.h"

namespace MarletFoundation {

/// What to do with one entry while a stack is searched for runs to fold.
enum class StackCollapsingDecision { MarkBegin, MarkEnd, CancelGrouping, Continue };

template <class Element>
class CollapsibleStack;
template <class Element>
class StackSlice;

/// One entry: owns the older ones behind it.
template <class Element>
struct StackEntry {
  std::shared_ptr<StackEntry> previousEntry;
  StackEntry* nextEntry = nullptr;
  Element object;

  StackEntry(std::shared_ptr<StackEntry> previous, StackEntry* next, Element element)
      : previousEntry(std::move(previous)), nextEntry(next), object(std::move(element)) {}
  StackEntry(const StackEntry&) = delete;
  StackEntry& operator=(const StackEntry&) = delete;
  /// Entry by entry: a long history is deeper than the stack of the thread.
  ~StackEntry() { releaseWithoutStack(std::move(previousEntry)); }
};

/// Walks a run of entries, from its oldest to its newest or, backwards, the other way. Holds until the stack
/// changes.
template <class Element>
class StackIterator {
 public:
  using value_type = Element;
  using difference_type = std::ptrdiff_t;

  StackIterator(const StackEntry<Element>* nextEntry, const StackEntry<Element>* stopAfter, bool forward)
      : nextEntry_(nextEntry), stopAfter_(stopAfter), forward_(forward) {}

  const Element& operator*() const { return nextEntry_->object; }
  const Element* operator->() const { return &nextEntry_->object; }
  StackIterator& operator++() {
    if (nextEntry_ == stopAfter_) {
      nextEntry_ = nullptr;
    } else {
      nextEntry_ = forward_ ? nextEntry_->nextEntry : nextEntry_->previousEntry.get();
    }
    return *this;
  }
  void operator++(int) { ++*this; }
  bool operator==(std::default_sentinel_t) const { return !nextEntry_; }

  /// The next element, which it steps over; nothing at the end.
  std::optional<Element> next() {
    if (!nextEntry_) return std::nullopt;
    std::optional<Element> element(nextEntry_->object);
    ++*this;
    return element;
  }

 private:
  const StackEntry<Element>* nextEntry_;
  const StackEntry<Element>* stopAfter_;
  bool forward_;
};

/// A stack from its newest entry to its oldest.
template <class Element>
class StackReverseView {
 public:
  explicit StackReverseView(const CollapsibleStack<Element>& stack) : stack_(stack) {}

  StackIterator<Element> makeIterator() const { return {stack_.top_.get(), stack_.bottom_, false}; }
  StackIterator<Element> begin() const { return makeIterator(); }
  std::default_sentinel_t end() const { return {}; }

 private:
  const CollapsibleStack<Element>& stack_;
};

/// A stack's entries that are newer than where the last folding ended, all before any; from the oldest to the
/// newest.
template <class Element>
class StackUncollapsedView {
 public:
  explicit StackUncollapsedView(const CollapsibleStack<Element>& stack) : stack_(stack) {}

  StackIterator<Element> makeIterator() const {
    return {stack_.oldestUncollapsed(), stack_.top_.get(), true};
  }
  StackIterator<Element> begin() const { return makeIterator(); }
  std::default_sentinel_t end() const { return {}; }

 private:
  const CollapsibleStack<Element>& stack_;
};

/// A stack, such as an undo history, in which runs of neighbouring entries can be folded into one. Walks, as
/// range-for does, from the oldest entry to the newest. One thread at a time.
template <class Element>
class CollapsibleStack {
 public:
  using Entry = StackEntry<Element>;
  using Iterator = StackIterator<Element>;

  CollapsibleStack() = default;
  CollapsibleStack(const CollapsibleStack&) = delete;
  CollapsibleStack& operator=(const CollapsibleStack&) = delete;
  ~CollapsibleStack() { clear(); }

  void push(Element element) {
    auto entry = std::make_shared<Entry>(top_, nullptr, std::move(element));
    if (top_) top_->nextEntry = entry.get();
    if (!bottom_) bottom_ = entry.get();
    top_ = std::move(entry);
    ++userEntries_;
  }

  std::optional<Element> pop() {
    if (!top_) return std::nullopt;
    const auto popped = std::move(top_);
    top_ = popped->previousEntry;
    if (top_) {
      top_->nextEntry = nullptr;
    } else {
      bottom_ = nullptr;
    }
    --userEntries_;
    if (lastCollapsed_ == popped.get()) lastCollapsed_ = top_.get();
    return std::move(popped->object);
  }

  std::optional<Element> peek() const { return top_ ? std::optional(top_->object) : std::nullopt; }
  bool isEmpty() const { return !top_; }
  std::size_t userEntries() const { return userEntries_; }

  void clear() {
    bottom_ = nullptr;
    lastCollapsed_ = nullptr;
    userEntries_ = 0;
    top_.reset();
  }

  Iterator makeIterator() const { return {bottom_, top_.get(), true}; }
  Iterator begin() const { return makeIterator(); }
  std::default_sentinel_t end() const { return {}; }
  // These show the stack as it is when they are walked, and hold as long as it lives.
  StackReverseView<Element> reverse() const { return StackReverseView<Element>(*this); }
  StackUncollapsedView<Element> uncollapsed() const { return StackUncollapsedView<Element>(*this); }

  /// Walks the entries to the newest, or only those that weren't folded yet, and asks `iterator` about each, with
  /// the element behind it or null. Each run from a `MarkBegin` to the next `MarkEnd` is then given to
  /// `replacer`, in order, and becomes the one element that it answers, or goes away when it answers none. A
  /// second `MarkBegin` begins anew.
  void collapseEntries(bool onlyUncollapsed,
                       const std::function<StackCollapsingDecision(const Element&, const Element*)>& iterator,
                       const std::function<std::optional<Element>(const StackSlice<Element>&)>& replacer);
  void collapseEntries(const std::function<StackCollapsingDecision(const Element&, const Element*)>& iterator,
                       const std::function<std::optional<Element>(const StackSlice<Element>&)>& replacer) {
    collapseEntries(true, iterator, replacer);
  }

 protected:
  CollapsibleStack(std::shared_ptr<Entry> top, Entry* bottom, std::size_t userEntries)
      : top_(std::move(top)), bottom_(bottom), userEntries_(userEntries) {}

 private:
  friend class StackReverseView<Element>;
  friend class StackUncollapsedView<Element>;

  Entry* oldestUncollapsed() const { return lastCollapsed_ ? lastCollapsed_->nextEntry : bottom_; }
  /// The link that owns `entry`.
  std::shared_ptr<Entry>& ownerOf(const Entry& entry) {
    return entry.nextEntry ? entry.nextEntry->previousEntry : top_;
  }
  void replace(const StackSlice<Element>& slice, std::optional<Element> replacement);

  std::shared_ptr<Entry> top_;
  Entry* bottom_ = nullptr;
  Entry* lastCollapsed_ = nullptr;
  std::size_t userEntries_ = 0;
};

/// A run of a stack's entries, for a replacer to look at.
template <class Element>
class StackSlice : public CollapsibleStack<Element> {
 public:
  using Base = CollapsibleStack<Element>;
  StackSlice(std::shared_ptr<StackEntry<Element>> top, StackEntry<Element>* bottom, std::size_t userEntries)
      : Base(std::move(top), bottom, userEntries) {}

  // A view doesn't change what it shows.
  void push(Element) = delete;
  std::optional<Element> pop() = delete;
  void clear() = delete;
  void collapseEntries() = delete;
};

template <class Element>
void CollapsibleStack<Element>::collapseEntries(
    bool onlyUncollapsed,
    const std::function<StackCollapsingDecision(const Element&, const Element*)>& iterator,
    const std::function<std::optional<Element>(const StackSlice<Element>&)>& replacer) {
  struct Run {
    Entry* bottom = nullptr;
    Entry* top = nullptr;
    std::size_t count = 0;
  };
  std::vector<Run> runs;
  // The run that has begun, if it has a bottom.
  Run open;
  for (auto* entry = onlyUncollapsed ? oldestUncollapsed() : bottom_; entry; entry = entry->nextEntry) {
    switch (iterator(entry->object, entry->nextEntry ? &entry->nextEntry->object : nullptr)) {
      case StackCollapsingDecision::MarkBegin:
        open = {entry, nullptr, 1};
        break;
      case StackCollapsingDecision::Continue:
        ++open.count;
        break;
      case StackCollapsingDecision::MarkEnd:
        if (open.bottom) runs.push_back({open.bottom, entry, open.count + 1});
        [[fallthrough]];
      case StackCollapsingDecision::CancelGrouping:
        open = {};
    }
  }
  for (const auto& run : runs) {
    const StackSlice<Element> slice(ownerOf(*run.top), run.bottom, run.count);
    replace(slice, replacer(slice));
  }
}

template <class Element>
void CollapsibleStack<Element>::replace(const StackSlice<Element>& slice,
                                        std::optional<Element> replacement) {
  const auto& run = static_cast<const CollapsibleStack&>(slice);
  const auto older = run.bottom_->previousEntry;
  auto* const newer = run.top_->nextEntry;
  auto& owner = ownerOf(*run.top_);
  userEntries_ -= run.userEntries_;
  if (replacement) {
    owner = std::make_shared<Entry>(older, newer, *std::move(replacement));
    ++userEntries_;
    if (older) older->nextEntry = owner.get();
    if (!older) bottom_ = owner.get();
  } else {
    owner = older;
    if (older) older->nextEntry = newer;
    if (!older) bottom_ = newer;
  }
  // After a run that went away this is its older neighbour, if there is one.
  lastCollapsed_ = owner.get();
}

}  // namespace MarletFoundation
