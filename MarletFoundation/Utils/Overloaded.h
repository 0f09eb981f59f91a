#pragma once

namespace MarletFoundation {

/// One visitor for `std::visit` made of several lambdas, one for each alternative.
template <class... Visitors>
struct overloaded : Visitors... {
  using Visitors::operator()...;
};
template <class... Visitors>
overloaded(Visitors...) -> overloaded<Visitors...>;

}  // namespace MarletFoundation
