#include "MarletFoundation/Platform/Progress.h"

#include <algorithm>
#include <utility>

namespace MarletFoundation {
namespace {

thread_local Progress::CurrentScope* innermostScope = nullptr;

}  // namespace

Progress::Progress(std::int64_t totalUnitCount, std::shared_ptr<Progress> parent, std::int64_t unitsOfParent)
    : tree_(parent ? parent->tree_ : std::make_shared<std::mutex>()),
      parent_(std::move(parent)),
      unitsOfParent_(unitsOfParent),
      totalUnitCount_(totalUnitCount),
      countsInParent_(parent_ != nullptr) {
  if (!parent_) return;
  const std::lock_guard lock(*tree_);
  parent_->children_.push_back(this);
  isCancelled_ = parent_->isCancelled_;
}

Progress::~Progress() {
  if (!parent_) return;
  {
    const std::lock_guard lock(*tree_);
    if (!countsInParent_) return;
    leaveParent();
  }
  parent_->tellObservers();
}

std::shared_ptr<Progress> Progress::make(std::int64_t totalUnitCount) {
  auto* scope = innermostScope;
  const auto units = scope ? std::exchange(scope->pendingUnitCount_, 0) : 0;
  auto parent = units > 0 ? scope->progress_ : nullptr;
  return std::shared_ptr<Progress>(new Progress(totalUnitCount, std::move(parent), units));
}

std::int64_t Progress::totalUnitCount() const { return totalUnitCount_; }

std::int64_t Progress::completedUnitCount() const {
  const std::lock_guard lock(*tree_);
  return completedUnitCount_;
}

void Progress::setCompletedUnitCount(std::int64_t count) {
  {
    const std::lock_guard lock(*tree_);
    addCompleted(count - completedUnitCount_);
  }
  tellObservers();
}

double Progress::fractionCompleted() const {
  const std::lock_guard lock(*tree_);
  return fraction();
}

bool Progress::isFinished() const {
  const std::lock_guard lock(*tree_);
  return totalUnitCount_ > 0 && completedUnitCount_ == totalUnitCount_;
}

void Progress::cancel() {
  std::vector<std::function<void()>> handlers;
  {
    const std::lock_guard lock(*tree_);
    collectCancellationHandlers(handlers);
  }
  for (const auto& handler : handlers) handler();
}

bool Progress::isCancelled() const {
  const std::lock_guard lock(*tree_);
  return isCancelled_;
}

void Progress::setCancellationHandler(std::function<void()> handler) {
  {
    const std::lock_guard lock(*tree_);
    if (!isCancelled_) {
      cancellationHandler_ = std::move(handler);
      return;
    }
  }
  if (handler) handler();
}

void Progress::setObserver(std::function<void(double)> observer) {
  const std::lock_guard lock(*tree_);
  observer_ = std::move(observer);
}

double Progress::fraction() const {
  if (totalUnitCount_ <= 0) return 0;
  double completed = static_cast<double>(completedUnitCount_);
  for (const auto* child : children_)
    completed += static_cast<double>(child->unitsOfParent_) * child->fraction();
  return std::min(completed / static_cast<double>(totalUnitCount_), 1.0);
}

void Progress::addCompleted(std::int64_t units) {
  completedUnitCount_ = std::min(completedUnitCount_ + units, totalUnitCount_);
  if (countsInParent_ && completedUnitCount_ == totalUnitCount_) leaveParent();
}

void Progress::leaveParent() {
  countsInParent_ = false;
  std::erase(parent_->children_, this);
  parent_->addCompleted(unitsOfParent_);
}

void Progress::collectCancellationHandlers(std::vector<std::function<void()>>& handlers) {
  if (std::exchange(isCancelled_, true)) return;
  if (cancellationHandler_) handlers.push_back(std::exchange(cancellationHandler_, nullptr));
  for (auto* child : children_) child->collectCancellationHandlers(handlers);
}

void Progress::tellObservers() const {
  std::vector<std::pair<std::function<void(double)>, double>> calls;
  {
    const std::lock_guard lock(*tree_);
    for (const auto* node = this; node; node = node->parent_.get()) {
      if (node->observer_) calls.emplace_back(node->observer_, node->fraction());
    }
  }
  for (const auto& [observer, fraction] : calls) observer(fraction);
}

Progress::CurrentScope::CurrentScope(std::shared_ptr<Progress> progress, std::int64_t pendingUnitCount)
    : progress_(std::move(progress)),
      pendingUnitCount_(pendingUnitCount),
      outer_(std::exchange(innermostScope, this)) {}

Progress::CurrentScope::~CurrentScope() {
  innermostScope = outer_;
  if (pendingUnitCount_ == 0) return;
  {
    const std::lock_guard lock(*progress_->tree_);
    progress_->addCompleted(pendingUnitCount_);
  }
  progress_->tellObservers();
}

std::shared_ptr<Progress> Progress::current() { return innermostScope ? innermostScope->progress_ : nullptr; }

}  // namespace MarletFoundation
