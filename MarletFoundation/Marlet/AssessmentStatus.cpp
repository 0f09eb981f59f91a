#include "MarletFoundation/Marlet/AssessmentStatus.h"

#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Utils/Overloaded.h"

namespace MarletFoundation {
namespace {

using E = AssessmentStatus::SerializationError;
using Case = AssessmentStatus::SerializationErrorCase;

AssessmentStatus::Fail readFail(const PropertyListDictionary& dictionary) {
  AssessmentStatus::Fail fail;
  if (const auto* hints = dictionary.find("Hints")) {
    require<E>(hints->array(), Case::hintsNotAnArray);
    for (const auto& hint : *hints->array()) {
      require<E>(hint.string(), Case::hintNotAString);
      fail.hints.push_back(*hint.string());
    }
  }
  fail.solution = optionalString<E>(dictionary, "Solution", Case::solutionNotAString);
  return fail;
}

}  // namespace

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"invalidStatus", R"(Value "{}" for the "Status" key is not recognized.)"},
      {"rootNotADictionary", R"(Not a dictionary.)"},
      {"missingStatus", R"(Missing "Status" key.)"},
      {"messageNotAString", R"(Value for the "Message" key is not a string.)"},
      {"hintsNotAnArray", R"(Value for the "Hints" key is not an array.)"},
      {"hintNotAString", R"(A value in the "Hints" key is not a string.)"},
      {"solutionNotAString", R"(Value for the "Solution" key is not a string.)"},
  };
  static constexpr ErrorTable table{"MarletFoundation.AssessmentStatus.SerializationError", rows,
                                    "Assessment Status Not Valid"};
  return table;
}

AssessmentStatus::AssessmentStatus(const PropertyListValue& value) {
  require<E>(value.dictionary(), Case::rootNotADictionary);
  const auto& dictionary = *value.dictionary();
  const auto status = requiredString<E>(dictionary, "Status", Case::missingStatus);
  if (status == "Pass") {
    outcome = Pass{optionalString<E>(dictionary, "Message", Case::messageNotAString)};
  } else if (status == "Fail") {
    outcome = readFail(dictionary);
  } else {
    throw E(Case::invalidStatus, status);
  }
}

PropertyListValue AssessmentStatus::propertyListValue() const {
  return std::visit(overloaded{[](const Pass& pass) {
                                 PropertyListDictionary dictionary{{"Status", "Pass"}};
                                 if (pass.message) dictionary["Message"] = *pass.message;
                                 return dictionary;
                               },
                               [](const Fail& fail) {
                                 PropertyListDictionary dictionary{{"Status", "Fail"}};
                                 if (!fail.hints.empty())
                                   dictionary["Hints"] =
                                       PropertyListValue::Array(fail.hints.begin(), fail.hints.end());
                                 if (fail.solution) dictionary["Solution"] = *fail.solution;
                                 return dictionary;
                               }},
                    outcome);
}

}  // namespace MarletFoundation
