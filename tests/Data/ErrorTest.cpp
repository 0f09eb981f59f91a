#include <gtest/gtest.h>

#include <thread>
#include <unordered_set>

#include "MarletFoundation/Data/CaseError.h"
#include "support/Failure.h"

namespace MarletFoundation::test {

enum class LoadCase { invalidVersion, invalidPart, wrapped, missingName };
const ErrorTable& errorTable(LoadCase) {
  static constexpr ErrorRow rows[] = {
      {"invalidVersion", "Use a version other than {}."},
      {"invalidPart", "{suggestion|Repair it.}", "The part {filename} is broken: {error}"},
      {"wrapped", "See: {suggestion}", "Wrapped."},
      {"missingName", "Add a name."},
  };
  static constexpr ErrorTable table{"Test.Load.SerializationError", rows,
                                    "The document could not be opened."};
  return table;
}
enum class PlainCase { first, second };
const ErrorTable& errorTable(PlainCase) {
  static constexpr ErrorRow rows[] = {{"first"}, {"second"}};
  static constexpr ErrorTable table{"Test.Plain", rows};
  return table;
}

namespace {

using LoadError = UserVisibleCaseError<LoadCase>;
using PlainError = CaseError<PlainCase>;

const LoadError missingName(LoadCase::missingName);
const LoadError invalidVersion(LoadCase::invalidVersion, "2.0 \"{}\"");

std::optional<std::string> words(const ErrorObject& object, std::string_view key) {
  const auto value = object.value(key);
  return value ? std::optional(std::get<std::string>(*value)) : std::nullopt;
}

class RegisteredErrors : public testing::Test {
 protected:
  void SetUp() override {
    registerUserVisibleError<LoadError>();
    registerUserVisibleErrorDomain("Test.Plain");
  }
  void TearDown() override {
    ErrorObject::setValueProvider("Test.Load.SerializationError", {});
    ErrorObject::setValueProvider("Test.Plain", {});
  }
};

TEST(CaseError, IsNamedByItsCaseAndPrintsItsPayload) {
  const std::tuple<LoadError, int, const char*> cases[] = {
      {invalidVersion, 0, R"(invalidVersion("2.0 \"{}\""))"},
      {LoadError(LoadCase::invalidPart, "a.part", PlainError(PlainCase::second)), 1,
       R"(invalidPart(filename: "a.part", error: second))"},
      {LoadError(LoadCase::wrapped, LoadError(LoadCase::wrapped, missingName)), 2,
       "wrapped(wrapped(missingName))"},
      {missingName, 3, "missingName"},
      // Made without what their words speak of, cases still print.
      {LoadError(LoadCase::invalidPart), 1, "invalidPart"},
  };
  for (const auto& [error, code, printed] : cases) {
    EXPECT_EQ(error.domain(), "Test.Load.SerializationError");
    EXPECT_EQ(error.code(), code);
    EXPECT_EQ(error.description(), printed);
    EXPECT_TRUE(std::string(printed).starts_with(error.what()));
    EXPECT_EQ(error.copy()->description(), printed);
    EXPECT_NO_THROW(error.errorContents());
    EXPECT_EQ(thrown<LoadError>([&copied = error] { copied.copy()->raise(); }), error);
  }
  EXPECT_FALSE(invalidVersion == LoadError(LoadCase::invalidVersion, "2.1"));
  EXPECT_FALSE(missingName == LoadError(LoadCase::wrapped));
  const PlainError first(PlainCase::first), second(PlainCase::second);
  EXPECT_EQ(std::unordered_set({first, second, first}).size(), 2u);
}

TEST_F(RegisteredErrors, WordsHoldThePayloadAndTheWordsOfTheWrappedError) {
  using Contents = UserVisibleErrorContents;
  const std::pair<LoadError, Contents> cases[] = {
      {missingName, {"The document could not be opened.", "Add a name."}},
      {invalidVersion, {"The document could not be opened.", "Use a version other than 2.0 \"{}\"."}},
      {LoadError(LoadCase::invalidPart, "a.part", missingName),
       {"The part a.part is broken: The document could not be opened.", "Add a name."}},
      {LoadError(LoadCase::invalidPart, "b", PlainError(PlainCase::second)),
       {"The part b is broken: The operation could not be completed. (Test.Plain error 1.)", "Repair it."}},
      {LoadError(LoadCase::wrapped, missingName), {"Wrapped.", "See: Optional(\"Add a name.\")"}},
      {LoadError(LoadCase::wrapped, PlainError(PlainCase::first)), {"Wrapped.", "See: nil"}},
  };
  for (const auto& [error, contents] : cases) {
    EXPECT_EQ(error.errorContents().localizedDescription, contents.localizedDescription);
    EXPECT_EQ(error.errorContents().localizedRecoverySuggestion, contents.localizedRecoverySuggestion);
  }
}

TEST_F(RegisteredErrors, AnErrorObjectAnswersThreeKeysOfItsDomain) {
  const ErrorObject object(invalidVersion);
  EXPECT_EQ(words(object, LocalizedDescriptionKey), "The document could not be opened.");
  EXPECT_EQ(object.localizedRecoverySuggestion(), "Use a version other than 2.0 \"{}\".");
  EXPECT_EQ(words(object, DebugDescriptionKey), invalidVersion.description());
  EXPECT_EQ(object.localizedFailureReason(), std::nullopt);
  EXPECT_EQ(object.value(FilePathKey), std::nullopt);
  EXPECT_EQ(words(ErrorObject(object), LocalizedDescriptionKey), "The document could not be opened.");

  const ErrorObject plain((PlainError(PlainCase::first)));
  const ErrorObject untyped("Test.Load.SerializationError", 3);
  for (const auto key : {LocalizedDescriptionKey, LocalizedRecoverySuggestionKey, DebugDescriptionKey}) {
    EXPECT_EQ(plain.value(key), std::nullopt) << key;
    EXPECT_EQ(untyped.value(key), std::nullopt) << key;
  }
}

TEST_F(RegisteredErrors, TheLastProviderOfADomainAnswersBehindTheUserInfo) {
  ErrorObject::setValueProvider("Test.Load.SerializationError",
                                [](const ErrorObject&, std::string_view) { return std::string("replaced"); });
  EXPECT_EQ(ErrorObject(missingName).localizedDescription(), "replaced");
  const ErrorObject own("Test.Load.SerializationError", 1, {{"LocalizedDescription", std::string("own")}});
  EXPECT_EQ(own.localizedDescription(), "own");
  EXPECT_EQ(own.localizedRecoverySuggestion(), "replaced");
  ErrorObject::setValueProvider("Test.Load.SerializationError", {});
  EXPECT_EQ(ErrorObject(missingName).localizedDescription(),
            "The operation could not be completed. (Test.Load.SerializationError error 3.)");

  std::thread registering([] {
    for (int i = 0; i < 500; ++i) registerUserVisibleError<LoadError>();
  });
  for (int i = 0; i < 500; ++i) ErrorObject(missingName).localizedDescription();
  registering.join();
}

TEST(ErrorObject, CarriesMessageAndCause) {
  const auto object = ErrorObject::withMessage("Diff", 4, "It failed.", missingName.copy());
  EXPECT_EQ(object.localizedDescription(), "It failed.");
  ASSERT_TRUE(object.underlyingError());
  EXPECT_NE(dynamic_cast<const ErrorObject*>(object.underlyingError().get()), nullptr);
  EXPECT_EQ(object.underlyingError()->domain(), "Test.Load.SerializationError");
  EXPECT_EQ(object.underlyingError()->code(), 3);
  EXPECT_EQ(object.description(), R"(Error(domain: Diff, code: 4, "It failed."))");
  EXPECT_EQ(ErrorObject::withMessage("Diff", 4, "It failed.").underlyingError(), nullptr);
  EXPECT_EQ(ErrorObject(LoadError(LoadCase::wrapped, missingName)).underlyingError()->description(),
            "missingName");

  EXPECT_EQ(object, ErrorObject::withMessage("Diff", 4, "It failed.", missingName.copy()));
  EXPECT_FALSE(object == ErrorObject::withMessage("Diff", 4, "It failed.", invalidVersion.copy()));
  EXPECT_FALSE(object == ErrorObject::withMessage("Diff", 4, "It failed."));
  EXPECT_FALSE(ErrorObject::withMessage("Diff", 4, "x") == ErrorObject::withMessage("Diff", 5, "x"));
}

TEST(ErrorObject, KeysCompareCanonically) {
  const ErrorObject composed("D", 1, {{"\u00E9", std::string("v")}});
  const ErrorObject decomposed("D", 1, {{"e\u0301", std::string("v")}});
  EXPECT_EQ(words(composed, "e\u0301"), "v");
  EXPECT_EQ(composed, decomposed);
  EXPECT_FALSE(composed == ErrorObject("D", 1, {{"e", std::string("v")}}));
}

}  // namespace
}  // namespace MarletFoundation::test
