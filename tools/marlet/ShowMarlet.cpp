#include "ShowMarlet.h"

#include <iostream>

#include "JSON.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

ordered_json json(const MarletSnapshot& marlet) {
  auto pages = ordered_json::array();
  for (const auto& page : marlet.pages)
    pages.push_back({{"name", orNull(page.name())}, {"filename", page.filename()}});
  return {{"name", marlet.name},
          {"uniquifier", marlet.uniquifier},
          {"target", marlet.target->identifier},
          {"requiresFullEnvironment", marlet.requiresFullEnvironment},
          {"hasIcon", marlet.marletIconURL.has_value()},
          {"hasSharedSources", marlet.sharedSourcesDirectoryURL.has_value()},
          {"hasSharedResources", marlet.sharedResourcesDirectoryURL.has_value()},
          {"pages", std::move(pages)}};
}

void printTree(const MarletSnapshot& marlet, const Terminal& terminal) {
  using Style = Terminal::Style;
  auto facts = "for " + marlet.target->targetOS;
  if (marlet.requiresFullEnvironment) facts += ", full environment";
  if (marlet.marletIconURL) facts += ", icon";
  if (marlet.sharedSourcesDirectoryURL) facts += ", shared sources";
  if (marlet.sharedResourcesDirectoryURL) facts += ", shared resources";
  std::cout << terminal.styled(Style::bold, printable(marlet.name)) << " "
            << terminal.styled(Style::dim, printable(facts)) << "\n";
  for (const auto& page : marlet.pages) {
    std::cout << (&page == &marlet.pages.back() ? "└─ " : "├─ ")
              << printable(page.name().value_or("(no name)")) << " "
              << terminal.styled(Style::dim, printable(page.filename())) << "\n";
  }
}

}  // namespace

void showMarlet(const MarletSnapshot& marlet, bool asJSON, const Terminal& terminal) {
  if (asJSON) {
    std::cout << dumped(json(marlet)) << "\n";
  } else {
    printTree(marlet, terminal);
  }
}
