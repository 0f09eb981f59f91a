#include "SourceCheck.h"

#include <algorithm>

#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

/// The tags' problems of a text, without those that another text of the same file has, too.
std::vector<Problem> problemsBeyond(std::u16string_view text, const std::vector<Problem>& known,
                                    const std::string& file) {
  std::vector<Problem> problems;
  for (auto& problem : tagProblems(text)) {
    const bool isKnown = std::any_of(known.begin(), known.end(), [&](const Problem& other) {
      return other.rule == problem.rule && other.description == problem.description;
    });
    if (isKnown) continue;
    problem.file = file;
    problems.push_back(std::move(problem));
  }
  return problems;
}

/// Those in a place where they are no good are counted, too: that mistake is reported already.
std::set<std::string> copySources(std::u16string_view text) {
  std::set<std::string> identifiers;
  for (const auto& [range, tag] : SourceTag::parseStringForTags(text).tags) {
    if (const auto* lines = std::get_if<SourceTag::MultiLineCopySourceStart>(&tag.payload))
      identifiers.insert(std::string(lines->identifier.view()));
    if (const auto* words = std::get_if<SourceTag::InlineCopySourceStart>(&tag.payload))
      identifiers.insert(std::string(words->identifier.view()));
  }
  return identifiers;
}

}  // namespace

std::vector<Problem> SourceCheck::check(const std::string& directory,
                                        const std::vector<std::string>& references,
                                        const std::optional<std::u16string>& authored,
                                        const std::u16string& learners) {
  const auto file = directory + "/Contents.swift";
  const auto& text = authored ? *authored : learners;
  auto problems = problemsBeyond(text, {}, file);
  if (text != learners) {
    for (auto& problem : problemsBeyond(learners, problems, file)) {
      problem.description = "With the learner's edits: " + problem.description;
      problems.push_back(std::move(problem));
    }
  }
  const auto identifiers = copySources(text);
  for (const auto& reference : references)
    copySources_[reference].insert(identifiers.begin(), identifiers.end());
  if (text.find(u"copy-destination") != std::u16string::npos) withDestinations_.push_back({file, text});
  return problems;
}

void SourceCheck::pass(const std::vector<std::string>& references) {
  unread_.insert(references.begin(), references.end());
}

std::vector<Problem> SourceCheck::copyDestinations() const {
  std::vector<Problem> problems;
  for (const auto& [file, text] : withDestinations_) {
    for (auto& problem : copyDestinationProblems(
             text, [this](std::string_view page, std::string_view name) { return find(page, name); })) {
      problem.file = file;
      problems.push_back(std::move(problem));
    }
  }
  return problems;
}

CopySourceLookup SourceCheck::find(std::string_view page, std::string_view identifier) const {
  if (unread_.contains(page)) return CopySourceLookup::found;
  const auto found = copySources_.find(page);
  if (found == copySources_.end()) return CopySourceLookup::noPage;
  return found->second.contains(std::string(identifier)) ? CopySourceLookup::found
                                                         : CopySourceLookup::noCopySource;
}
