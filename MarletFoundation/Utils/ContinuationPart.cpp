#include "MarletFoundation/Utils/ContinuationPart.h"

#include <utility>
#include <vector>

namespace MarletFoundation {

ContinuationPart::Value ContinuationPart::run(Link part) {
  std::vector<Link> waiting;
  while (part) {
    for (; part->prior_; part = part->prior_) waiting.push_back(part);
    auto outcome = part->proceed(nullptr);
    while (outcome.value) {
      if (waiting.empty()) return outcome.value;
      const auto next = std::move(waiting.back());
      waiting.pop_back();
      outcome = next->proceed(outcome.value.get());
    }
    part = std::move(outcome.next);
  }
  return nullptr;
}

}  // namespace MarletFoundation
