#include "MarletFoundation/DiffPack/DiffPackType.h"

namespace MarletFoundation {

std::string_view description(DiffPackType type) {
  switch (type) {
    case DiffPackType::UpdatePack:
      return "Update";
    case DiffPackType::UserEditPack:
      return "UserEdit";
  }
  return {};
}

std::string_view description(DiffPackDocumentType type) {
  switch (type) {
    case DiffPackDocumentType::MarletBook:
      return "MarletBook";
  }
  return {};
}

}  // namespace MarletFoundation
