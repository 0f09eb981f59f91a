#include "Targets.h"

#include <iostream>

#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

ExitStatus listTargets(bool asJSON, const Terminal& terminal) {
  auto list = ordered_json::array();
  for (const auto& target : Target::allTargets()) {
    const auto triple = target->targetTripleForHostArchitecture();
    list.push_back({{"identifier", target->identifier},
                    {"sdkRoot", target->SDKRoot.path()},
                    {"sdkVersion", target->SDKVersion},
                    {"deploymentTarget", target->deploymentTarget},
                    {"targetOS", target->targetOS},
                    {"triple", triple}});
    if (!asJSON)
      std::cout << terminal.styled(Terminal::Style::bold, printable(target->identifier)) << " "
                << printable(triple + ", SDK " + target->SDKVersion + " in " + target->SDKRoot.path())
                << "\n";
  }
  if (asJSON) std::cout << dumped(list) << "\n";
  return ExitStatus::good;
}
