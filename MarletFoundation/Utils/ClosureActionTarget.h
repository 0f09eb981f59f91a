#pragma once

#include <functional>
#include <memory>
#include <utility>

#include "MarletFoundation/Platform/PropertyListObject.h"

namespace MarletFoundation {

/// Gives a function the shape of a target with an action, for controls that take both. The maker keeps it alive
/// as long as the control may fire. The function runs on the thread of whoever performs the action.
class ClosureActionTarget {
 public:
  /// The object that the action comes from, or null.
  using Sender = PropertyListObjectPointer;
  using Selector = void (ClosureActionTarget::*)(const Sender&) const;

  /// `performAction`, as controls take it beside the target.
  static const Selector actionSelector;

  std::function<void(const Sender&)> action;

  explicit ClosureActionTarget(std::function<void(const Sender&)> itsAction) : action(std::move(itsAction)) {}
  ClosureActionTarget(const ClosureActionTarget&) = delete;
  ClosureActionTarget& operator=(const ClosureActionTarget&) = delete;

  void performAction(const Sender& sender) const { action(sender); }
};

inline constexpr ClosureActionTarget::Selector ClosureActionTarget::actionSelector =
    &ClosureActionTarget::performAction;

}  // namespace MarletFoundation
