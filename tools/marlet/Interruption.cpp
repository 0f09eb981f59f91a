#include "Interruption.h"

#include <signal.h>

#include "MarletFoundation/MarletFoundation.h"

namespace {

volatile sig_atomic_t received = 0;

void endBy(int number) {
  ::signal(number, SIG_DFL);
  ::raise(number);
}

void handle(int number) {
  // A second one doesn't wait.
  if (received != 0 || !MarletFoundation::isWriting()) endBy(number);
  received = number;
  MarletFoundation::cancelWrites();
}

}  // namespace

void handleInterruptions() {
  struct sigaction action {};
  action.sa_handler = handle;
  action.sa_flags = SA_RESTART;
  for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
    struct sigaction now {};
    // One that is ignored, as below nohup, stays so.
    if (::sigaction(number, nullptr, &now) == 0 && now.sa_handler != SIG_IGN)
      ::sigaction(number, &action, nullptr);
  }
}

void endIfInterrupted() {
  if (received != 0) endBy(received);
}
