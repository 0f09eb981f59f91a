#include <gtest/gtest.h>

#include "MarletFoundation/Marlet/AssessmentInformation.h"
#include "support/Failure.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using D = PropertyListDictionary;
using A = PropertyListValue::Array;
using Status = AssessmentStatus;

TEST(Assessment, statusesSurviveStoring) {
  const std::pair<Status, PropertyListValue> cases[] = {
      {Status::Pass{}, D{{"Status", "Pass"}}},
      {Status::Pass{""}, D{{"Status", "Pass"}, {"Message", ""}}},
      {Status::Fail{}, D{{"Status", "Fail"}}},
      {Status::Fail{{"b", "a"}, "s"}, D{{"Status", "Fail"}, {"Hints", A{"b", "a"}}, {"Solution", "s"}}},
  };
  for (const auto& [status, value] : cases) {
    EXPECT_EQ(status.propertyListValue(), value);
    EXPECT_EQ(Status(value), status);
    EXPECT_NE(status, Status(Status::Pass{"other"}));
  }
}

TEST(Assessment, badStatusesExplainThemselves) {
  const struct {
    PropertyListValue value;
    std::string description, words;
  } cases[] = {
      {"Pass", "rootNotADictionary", "Not a dictionary."},
      {D{{"Status", 1}}, "missingStatus", R"(Missing "Status" key.)"},
      {D{{"Status", "pass"}}, R"(invalidStatus("pass"))",
       R"(Value "pass" for the "Status" key is not recognized.)"},
      {D{{"Status", "Pass"}, {"Message", 1}}, "messageNotAString",
       R"(Value for the "Message" key is not a string.)"},
      {D{{"Status", "Fail"}, {"Hints", "x"}}, "hintsNotAnArray",
       R"(Value for the "Hints" key is not an array.)"},
      {D{{"Status", "Fail"}, {"Hints", A{"x", 1}}, {"Solution", 1}}, "hintNotAString",
       R"(A value in the "Hints" key is not a string.)"},
      {D{{"Status", "Fail"}, {"Message", 1}, {"Solution", 1}}, "solutionNotAString",
       R"(Value for the "Solution" key is not a string.)"},
  };
  int code = 1;
  for (const auto& [value, description, words] : cases) {
    const auto error = thrown<Status::SerializationError>([&v = value] { Status{v}; });
    EXPECT_EQ(error.description(), description);
    EXPECT_EQ(error.code(), description.starts_with("invalidStatus") ? 0 : code++);
    EXPECT_EQ(error.errorContents(), (UserVisibleErrorContents{"Assessment Status Not Valid", words}));
  }
}

TEST(Assessment, everPassedOnlyGrows) {
  EXPECT_TRUE(AssessmentInformation(Status::Fail{}, true).everPassed);
  EXPECT_TRUE(AssessmentInformation(Status::Pass{}, false).everPassed);
  EXPECT_FALSE(AssessmentInformation(Status::Fail{}, false).everPassed);
}

TEST(Assessment, theStoredFlagIsTakenAsItStands) {
  const D passed{{"Status", "Pass"}};
  EXPECT_FALSE(AssessmentInformation(D{{"Status", passed}, {"EverPassed", false}}).everPassed);
  EXPECT_FALSE(AssessmentInformation(D{{"Status", passed}, {"EverPassed", 1}}).everPassed);
  EXPECT_FALSE(AssessmentInformation(D{{"Status", passed}}).everPassed);
  const PropertyListValue stored = D{{"Status", D{{"Status", "Fail"}}}, {"EverPassed", true}};
  EXPECT_EQ(AssessmentInformation(stored).propertyListValue(), stored);
  EXPECT_TRUE(AssessmentInformation(stored).everPassed);
}

TEST(Assessment, badInformationExplainsItself) {
  const auto words = [](const PropertyListValue& value) {
    const auto error = errorOf([&] { AssessmentInformation{value}; });
    const auto contents = dynamic_cast<const UserVisibleError&>(*error).errorContents();
    return contents.localizedDescription + ": " + contents.localizedRecoverySuggestion;
  };
  EXPECT_EQ(words("x"),
            "Unable to load assessment information: The assessment information is not a dictionary.");
  EXPECT_EQ(words(D{{"EverPassed", true}}),
            R"(Unable to load assessment information: The "Status" key is missing.)");
  EXPECT_EQ(words(D{{"Status", "Pass"}}), "Assessment Status Not Valid: Not a dictionary.");
}

}  // namespace
}  // namespace MarletFoundation::test
