#pragma once

#include "MarletFoundation/Platform/HostEnvironment.h"

namespace MarletFoundation::test {

/// The host's environment, changed by a function for as long as this lives.
class ChangedHost {
 public:
  template <class Change>
  explicit ChangedHost(Change change) {
    auto environment = before_;
    change(environment);
    HostEnvironment::setCurrent(std::move(environment));
  }
  ~ChangedHost() { HostEnvironment::setCurrent(before_); }
  ChangedHost(const ChangedHost&) = delete;
  ChangedHost& operator=(const ChangedHost&) = delete;

 private:
  const HostEnvironment before_ = HostEnvironment::current();
};

}  // namespace MarletFoundation::test
