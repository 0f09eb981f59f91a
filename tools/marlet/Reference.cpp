#include "Reference.h"

void printReference(const CLI::App& app, Reference reference, std::ostream& out) {
  const auto table = optionTable(app);
  switch (reference) {
    case Reference::manualPage:
      return printManualPage(table, out);
    case Reference::bash:
      return printBashCompletion(table, out);
    case Reference::zsh:
      return printZshCompletion(table, out);
    case Reference::fish:
      return printFishCompletion(table, out);
  }
}
