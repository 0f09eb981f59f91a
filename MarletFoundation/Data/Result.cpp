#include "MarletFoundation/Data/Result.h"

namespace MarletFoundation {
namespace {

/// Carries what was thrown by code that knows no `Error`.
class ForeignException final : public Error {
 public:
  ForeignException(std::exception_ptr thrown, std::string words)
      : thrown_(std::move(thrown)), words_(std::move(words)) {}

  std::string_view domain() const override { return "MarletFoundation.ForeignException"; }
  int code() const override { return 0; }
  std::string description() const override { return words_; }
  ErrorPointer copy() const override { return std::make_shared<ForeignException>(*this); }
  [[noreturn]] void raise() const override { std::rethrow_exception(thrown_); }
  const char* what() const noexcept override { return words_.c_str(); }

 private:
  std::exception_ptr thrown_;
  std::string words_;
};

}  // namespace

ErrorPointer currentError() {
  try {
    throw;
  } catch (const Error& error) {
    return error.copy();
  } catch (const std::exception& error) {
    return std::make_shared<ForeignException>(std::current_exception(), error.what());
  } catch (...) {
    return std::make_shared<ForeignException>(std::current_exception(), "unknown exception");
  }
}

}  // namespace MarletFoundation
