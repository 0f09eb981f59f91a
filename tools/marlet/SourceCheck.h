#pragma once

#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "Problem.h"
#include "TagProblems.h"

/// Judges the sources of a book's code pages, one by one, and what they copy from each other once all are known.
class SourceCheck {
 public:
  /// The problems of a page's tags: those of the source as its author wrote it, where that can be read, then
  /// those that the learner's edits add. `directory` is the page's, relative to the book; `references` are what
  /// other pages may call it.
  std::vector<Problem> check(const std::string& directory, const std::vector<std::string>& references,
                             const std::optional<std::u16string>& authored, const std::u16string& learners);
  /// A page that can't be read: nobody knows what it offers, so its copy sources are not missed.
  void pass(const std::vector<std::string>& references);
  /// The copy destinations of all pages that can't be filled from any of them.
  std::vector<Problem> copyDestinations() const;

 private:
  struct Source {
    std::string file;
    std::u16string text;
  };

  CopySourceLookup find(std::string_view page, std::string_view identifier) const;

  std::map<std::string, std::set<std::string>, std::less<>> copySources_;  // by reference
  std::set<std::string, std::less<>> unread_;
  std::vector<Source> withDestinations_;
};
