#pragma once

#include "support/Tree.h"

namespace MarletFoundation::test {

/// A book that opens: two chapters, three pages, one of them a cutscene, all optional parts present.
Tree goodBook();

}  // namespace MarletFoundation::test
