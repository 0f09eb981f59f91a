#pragma once

namespace MarletFoundation {

/// What becomes of an item, were it a link to nowhere, that has the name which something new is to bear.
enum class ExistingItem {
  Replaced,
  /// It stays, and writing throws EEXIST, also when it came there while the new item was built.
  Kept,
};

}  // namespace MarletFoundation
