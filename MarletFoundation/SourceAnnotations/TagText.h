#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace MarletFoundation {

/// A piece of a page's source, in UTF-8, that keeps the text it is cut from alive. Inline tags may share their
/// end, so that the pieces of one line overlap: sharing keeps their memory linear in the line. Unpaired
/// surrogates of the source stand as U+FFFD.
class TagText {
 public:
  TagText() = default;
  TagText(std::string text) : owner_(std::make_shared<const std::string>(std::move(text))), view_(*owner_) {}
  /// `view` lies in `*owner`; without an owner it must live for ever.
  TagText(std::shared_ptr<const std::string> owner, std::string_view view)
      : owner_(std::move(owner)), view_(view) {}

  std::string_view view() const { return view_; }
  operator std::string_view() const { return view_; }
  bool operator==(const TagText& other) const { return view_ == other.view_; }

 private:
  std::shared_ptr<const std::string> owner_;
  std::string_view view_;
};

}  // namespace MarletFoundation
