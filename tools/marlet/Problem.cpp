#include "Problem.h"

#include "ErrorWords.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "ProblemPlace.h"

using namespace MarletFoundation;

namespace {

Problem described(std::string rule, const Error& error) {
  const ErrorObject object(error);
  Problem problem;
  problem.rule = std::move(rule);
  problem.domain = object.domain();
  problem.code = object.code();
  if (!error.caseName().empty()) problem.caseName = error.caseName();
  problem.description = wordsOf(error);
  problem.recoverySuggestion = object.localizedRecoverySuggestion();
  return problem;
}

Problem placed(const ProblemPlace& place, const Error& error) {
  auto problem = described(place.rule, error);
  problem.file = place.file;
  problem.line = place.line;
  return problem;
}

}  // namespace

Problem problemOfBookLoad(const Error& error) { return placed(placeInBook(error), error); }

Problem problemOfPageLoad(const Error& error, const std::string& directory) {
  return placed(placeInPage(directory, error), error);
}

Problem problemOfMarletLoad(const Error& error, const std::string& file) {
  return placed(placeInMarlet(error, file), error);
}

Problem warning(std::string rule, std::string description, std::string file) {
  Problem problem;
  problem.severity = "warning";
  problem.rule = std::move(rule);
  problem.description = std::move(description);
  problem.file = std::move(file);
  return problem;
}

Problem problemOfUnreadablePath(const Error& error) { return described("path.unreadable", error); }

Problem problemOfFatalError(std::string_view message) {
  Problem problem;
  problem.rule = "fatal";
  problem.description = message;
  return problem;
}

nlohmann::ordered_json json(const Problem& problem) {
  return {{"severity", problem.severity},
          {"rule", problem.rule},
          {"domain", orNull(problem.domain)},
          {"code", orNull(problem.code)},
          {"case", orNull(problem.caseName)},
          {"description", problem.description},
          {"recoverySuggestion", orNull(problem.recoverySuggestion)},
          {"file", orNull(problem.file)},
          {"line", orNull(problem.line)},
          {"column", orNull(problem.column)},
          {"length", orNull(problem.length)}};
}
