#pragma once

#include <atomic>

#include "ArcCopier/ArcCopier.h"

/// What the handle stands for.
struct ArcCopier {
  void* userData = nullptr;
  ArcCopierLimits limits = ArcCopierDefaultLimits();
  ArcCopierFileHandler started = nullptr;
  ArcCopierFileHandler finished = nullptr;
  ArcCopierUpdateHandler update = nullptr;
  ArcCopierErrorHandler fatalError = nullptr;
  ArcCopierErrorHandler fatalFileError = nullptr;
  ArcCopierErrorHandler fileConflict = nullptr;
  ArcCopierErrorHandler fileError = nullptr;
  std::atomic<bool> isCancelled = false;

  /// A handler's answer; one that isn't set goes on.
  template <class Handler, class... Arguments>
  int call(Handler handler, Arguments... arguments) {
    return handler ? handler(this, arguments...) : int(ArcCopierContinue);
  }
};
