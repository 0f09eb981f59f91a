#include "Ending.h"

#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <exception>
#include <new>

#include "Guarded.h"

namespace {

/// "PATH: the change is made, but then " behind a commit.
std::string madeWords;
std::atomic<bool> isOutOfMemory = false;
std::terminate_handler otherTermination;

[[noreturn]] void terminated() {
  try {
    throw;
  } catch (const std::bad_alloc&) {
    ::_exit(static_cast<int>(endingWithoutMemory()));
  } catch (...) {
  }
  otherTermination();
  std::abort();
}

}  // namespace

void commit(const std::string& path, const std::function<void()>& write) {
  auto words = printable(path) + ": the change is made, but then: ";
  try {
    write();
  } catch (const MarletFoundation::Error& error) {
    CommandFailure failure{ExitStatus::failedWrite, path + ": " + wordsWithSuggestion(error)};
    if (error.domain() == MarletFoundation::PosixErrorDomain && error.code() == ESTALE)
      throw ChangedMeanwhile{std::move(failure)};
    throw failure;
  }
  madeWords = std::move(words);
  // A reader of the report who goes away must not end the command before it has said so.
  std::signal(SIGPIPE, SIG_IGN);
}

bool isChangeMade() { return !madeWords.empty(); }

ExitStatus failing(ExitStatus status, std::string_view sentence, const Terminal& terminal) {
  terminal.complain(madeWords + std::string(sentence));
  return isChangeMade() ? ExitStatus::changeMade : status;
}

void watchMemory() {
  std::set_new_handler([] {
    noteOutOfMemory();
    throw std::bad_alloc();
  });
  otherTermination = std::set_terminate(terminated);
}

void noteOutOfMemory() noexcept { isOutOfMemory = true; }

bool wasOutOfMemory() noexcept { return isOutOfMemory; }

ExitStatus endingWithoutMemory() noexcept {
  for (const std::string_view words : {std::string_view("marlet: "), std::string_view(madeWords),
                                       std::string_view("there is not enough memory.\n")}) {
    if (::write(STDERR_FILENO, words.data(), words.size()) < 0) break;
  }
  return isChangeMade() ? ExitStatus::changeMade : ExitStatus::outOfMemory;
}
