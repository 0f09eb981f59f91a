#include "Guarded.h"

#include <iostream>

#include "Ending.h"
#include "FatalProblem.h"
#include "JSON.h"

using namespace MarletFoundation;

void requirePrinted() {
  if (!std::cout.flush()) throw CommandFailure{ExitStatus::failedWrite, "standard output can't be written."};
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
    sentence = path + ": " + wordsWithSuggestion(error);
  } catch (const FatalProblem& fatal) {
    sentence = path + ": " + fatal.message;
  } catch (const NotRepresentable& reason) {
    sentence = path + ": " + reason.what();
  }
  return failing(status, sentence, terminal);
}
