#include "MarletFoundation/Marlet/AssessmentInformation.h"

#include "MarletFoundation/Marlet/LoadChecks.h"

namespace MarletFoundation {
namespace {

using E = AssessmentInformation::SerializationError;
using Case = AssessmentInformation::SerializationErrorCase;

const PropertyListDictionary& root(const PropertyListValue& value) {
  require<E>(value.dictionary(), Case::rootNotADictionary);
  return *value.dictionary();
}

const PropertyListValue& status(const PropertyListDictionary& dictionary) {
  const auto* value = dictionary.find("Status");
  require<E>(value, Case::missingStatus);
  return *value;
}

bool flag(const PropertyListDictionary& dictionary) {
  const auto* value = dictionary.find("EverPassed");
  return value && value->boolean() && *value->boolean();
}

}  // namespace

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"rootNotADictionary", R"(The assessment information is not a dictionary.)"},
      {"missingStatus", R"(The "Status" key is missing.)"},
  };
  static constexpr ErrorTable table{"MarletFoundation.AssessmentInformation.SerializationError", rows,
                                    "Unable to load assessment information"};
  return table;
}

AssessmentInformation::AssessmentInformation(const PropertyListValue& value)
    : currentStatus(status(root(value))), everPassed(flag(root(value))) {}

PropertyListValue AssessmentInformation::propertyListValue() const {
  return PropertyListDictionary{{"Status", currentStatus.propertyListValue()}, {"EverPassed", everPassed}};
}

}  // namespace MarletFoundation
