#include "Check.h"

#include <algorithm>
#include <iostream>

#include "CheckBook.h"
#include "CheckMarlet.h"
#include "Document.h"
#include "ErrorWords.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;

namespace {

struct Report {
  std::string path;
  std::string kind;
  bool isReadable;
  std::vector<Problem> problems;

  bool isOK() const {
    return std::none_of(problems.begin(), problems.end(),
                        [](const Problem& p) { return p.severity == "error"; });
  }
};

Report reportOf(const Document& document) {
  switch (document.kind) {
    case DocumentKind::book:
      return {document.path, "book", true, problemsOfBook(document)};
    case DocumentKind::classic:
      return {document.path, "classic", true, problemsOfMarlet(document)};
    case DocumentKind::unknown:
      break;
  }
  Problem problem;
  problem.rule = "document.unknownKind";
  problem.description = "This is neither a book nor a classic document.";
  return {document.path, "unknown", true, {problem}};
}

Report report(const std::string& path) {
  try {
    return readOneState(
        path, [&] { return Document(path); }, reportOf);
  } catch (const Error& error) {
    return {path, "unknown", false, {problemOfUnreadablePath(error)}};
  }
}

nlohmann::ordered_json json(const Report& report) {
  auto problems = nlohmann::ordered_json::array();
  for (const auto& problem : report.problems) problems.push_back(json(problem));
  return {
      {"path", report.path}, {"kind", report.kind}, {"ok", report.isOK()}, {"problems", std::move(problems)}};
}

/// `path:line:column: error: description: suggestion [rule]`, without the parts that don't apply.
void print(const Report& report, const Problem& problem, const Terminal& terminal) {
  std::string place = report.path;
  if (problem.file) place += (place.ends_with('/') ? "" : "/") + *problem.file;
  if (problem.line) place += ":" + std::to_string(*problem.line);
  if (problem.line && problem.column) place += ":" + std::to_string(*problem.column);
  auto text = problem.description;
  if (problem.recoverySuggestion) text += suggested(text, *problem.recoverySuggestion);
  const auto style = problem.severity == "error" ? Terminal::Style::red : Terminal::Style::yellow;
  std::cout << terminal.styled(Terminal::Style::bold, printable(place) + ":") << " "
            << terminal.styled(style, problem.severity + ":") << " " << printable(text) << " "
            << terminal.styled(Terminal::Style::dim, "[" + problem.rule + "]") << "\n";
}

std::string summary(const std::vector<Report>& reports) {
  std::size_t bad = 0;
  std::size_t problems = 0;
  for (const auto& report : reports) {
    bad += report.isOK() ? 0 : 1;
    problems += report.problems.size();
  }
  const auto counted = [](std::size_t n, const std::string& noun) {
    return std::to_string(n) + " " + noun + (n == 1 ? "" : "s");
  };
  return counted(reports.size(), "document") +
         " checked: " + (bad == 0 ? "all good" : std::to_string(bad) + " with errors") +
         (problems == 0 ? "" : ", " + counted(problems, "problem"));
}

}  // namespace

ExitStatus check(const std::vector<std::string>& paths, bool asJSON, const Terminal& terminal) {
  std::vector<Report> reports;
  for (const auto& path : paths) {
    reports.push_back(report(path));
    if (terminal.verbose) terminal.note(path + ": " + reports.back().kind);
    if (!asJSON) {
      for (const auto& problem : reports.back().problems) print(reports.back(), problem, terminal);
    }
  }
  if (asJSON) {
    auto array = nlohmann::ordered_json::array();
    for (const auto& report : reports) array.push_back(json(report));
    std::cout << dumped(array) << "\n";
  } else {
    terminal.note(summary(reports));
  }
  if (!std::all_of(reports.begin(), reports.end(), [](const Report& r) { return r.isReadable; })) {
    return ExitStatus::unreadablePath;
  }
  return std::all_of(reports.begin(), reports.end(), [](const Report& r) { return r.isOK(); })
             ? ExitStatus::good
             : ExitStatus::negative;
}
