#include "Guarded.h"

#include "FatalProblem.h"
#include "JSON.h"
#include "MarletFoundation/Platform/ErrorObject.h"

using namespace MarletFoundation;

std::string inWords(const Error& error) {
  const ErrorObject object(error);
  const auto suggestion = object.localizedRecoverySuggestion();
  return object.localizedDescription() + (suggestion ? ": " + *suggestion : "");
}

ExitStatus guarded(const std::string& path, const Terminal& terminal,
                   const std::function<ExitStatus()>& work) {
  auto status = ExitStatus::negative;
  std::string sentence;
  try {
    return work();
  } catch (const CommandFailure& failure) {
    status = failure.status;
    sentence = failure.sentence;
  } catch (const Error& error) {
    sentence = path + ": " + inWords(error);
  } catch (const FatalProblem& fatal) {
    sentence = path + ": " + fatal.message;
  } catch (const NotRepresentable& reason) {
    sentence = path + ": " + reason.what();
  }
  terminal.complain(printable(sentence));
  return status;
}
