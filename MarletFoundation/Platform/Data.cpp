#include "MarletFoundation/Platform/Data.h"

namespace MarletFoundation {

Data::Data(std::string text) {
  auto owner = std::make_shared<const std::string>(std::move(text));
  bytes_ = {reinterpret_cast<const std::uint8_t*>(owner->data()), owner->size()};
  owner_ = std::move(owner);
}

Data::Data(std::vector<std::uint8_t> bytes) {
  auto owner = std::make_shared<const std::vector<std::uint8_t>>(std::move(bytes));
  bytes_ = *owner;
  owner_ = std::move(owner);
}

}  // namespace MarletFoundation
