#include "Guarded.h"

#include "FatalProblem.h"
#include "JSON.h"

using namespace MarletFoundation;

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
    sentence = path + ": " + wordsWithSuggestion(error);
  } catch (const FatalProblem& fatal) {
    sentence = path + ": " + fatal.message;
  } catch (const NotRepresentable& reason) {
    sentence = path + ": " + reason.what();
  }
  terminal.complain(printable(sentence));
  return status;
}
