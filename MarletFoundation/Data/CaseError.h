#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>

#include "MarletFoundation/Data/UserVisibleError.h"

namespace MarletFoundation {

/// One case of an error type: its name and, where users see it, its words. In the words, `{}` stands for the
/// case's string, `{filename}` for its file name, `{error}` for the localized description of the error it
/// carries, `{suggestion}` for that error's recovery suggestion in the debug form of an optional, and
/// `{suggestion|WORDS}` for that suggestion or, if there is none, WORDS.
struct ErrorRow {
  std::string_view name;
  std::string_view recoverySuggestion = {};
  /// Empty where the table's description holds.
  std::string_view description = {};
  /// The error code where it isn't the case's index.
  std::optional<int> code = {};
};

/// All cases of an error type in their stated order.
struct ErrorTable {
  std::string_view domain;
  std::span<const ErrorRow> rows;
  /// The description of every row without one of its own.
  std::string_view description = {};
};

/// What a case carries; most carry nothing.
struct ErrorPayload {
  std::optional<std::string> string;
  std::optional<std::string> filename;
  ErrorPointer error;
};

/// `missingName`, `invalidVersion("x")`, `invalidManifest(…)`, `invalidChapter(filename: "x", error:
/// missingName)`
MARLET_EXPORT std::string errorDescription(const ErrorRow& row, const ErrorPayload& payload);
/// The words of a row with the payload put in.
MARLET_EXPORT UserVisibleErrorContents errorContents(const ErrorTable& table, const ErrorRow& row,
                                                     const ErrorPayload& payload);

/// What plain and user-visible case errors share. `errorTable(Case)`, declared beside the enumeration, gives
/// the names and words; a code is the case's index, unless its row states another.
template <class Derived, class CaseType, class Base>
class MARLET_EXPORT BasicCaseError : public Base, public ErrorPayload {
 public:
  using Case = CaseType;
  Case kind;

  explicit BasicCaseError(Case c) : kind(c) {}
  BasicCaseError(Case c, std::string_view text) : ErrorPayload{std::string(text), {}, {}}, kind(c) {}
  BasicCaseError(Case c, const Error& wrapped) : ErrorPayload{{}, {}, wrapped.copy()}, kind(c) {}
  BasicCaseError(Case c, std::string_view name, const Error& wrapped)
      : ErrorPayload{{}, std::string(name), wrapped.copy()}, kind(c) {}

  static std::string_view errorDomain() { return errorTable(Case{}).domain; }
  const ErrorRow& row() const { return errorTable(kind).rows[static_cast<std::size_t>(kind)]; }

  std::string_view domain() const override { return errorDomain(); }
  int code() const override { return row().code.value_or(static_cast<int>(kind)); }
  std::string_view caseName() const override { return row().name; }
  std::string description() const override { return errorDescription(row(), *this); }
  ErrorPointer underlyingError() const override { return error; }
  ErrorPointer copy() const override { return std::make_shared<Derived>(static_cast<const Derived&>(*this)); }
  [[noreturn]] void raise() const override { throw static_cast<const Derived&>(*this); }
  // The names are literals, so each ends in NUL.
  const char* what() const noexcept override { return row().name.data(); }

  /// The same case with equal payloads; carried errors compare by their printed forms.
  bool operator==(const BasicCaseError& other) const {
    return kind == other.kind && description() == other.description();
  }
};

/// An error type without words of its own.
template <class CaseType>
class MARLET_EXPORT CaseError final : public BasicCaseError<CaseError<CaseType>, CaseType, Error> {
 public:
  using BasicCaseError<CaseError, CaseType, Error>::BasicCaseError;
};

/// An error type that explains itself to a user in the words of its table.
template <class CaseType>
class MARLET_EXPORT UserVisibleCaseError final
    : public BasicCaseError<UserVisibleCaseError<CaseType>, CaseType, UserVisibleError> {
 public:
  using BasicCaseError<UserVisibleCaseError, CaseType, UserVisibleError>::BasicCaseError;
  UserVisibleErrorContents errorContents() const override {
    return MarletFoundation::errorContents(errorTable(this->kind), this->row(), *this);
  }
};

}  // namespace MarletFoundation

/// By case.
template <class Case>
struct std::hash<MarletFoundation::CaseError<Case>> {
  std::size_t operator()(const MarletFoundation::CaseError<Case>& error) const {
    return std::hash<Case>()(error.kind);
  }
};
