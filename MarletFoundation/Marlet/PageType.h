#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "MarletFoundation/Data/Either.h"
#include "MarletFoundation/Marlet/LiveViewMode.h"
#include "MarletFoundation/Marlet/MarletHint.h"
#include "MarletFoundation/Marlet/MarletResultInfo.h"
#include "MarletFoundation/Platform/FileWrapper.h"

/// @file
/// What code may ask of a page without knowing whether it is a snapshot or live, of a book or of a classic
/// document. Texts and record are answered by reference and hold as long as the page; the rest is answered by
/// value, so that a page may make it up.
namespace MarletFoundation {

class PageSnapshotType;
class BookPageType;

/// Any page.
class MARLET_EXPORT PageType {
 public:
  virtual ~PageType() = default;

  /// The name of the page's directory.
  virtual std::string filename() const = 0;
  /// A page of a book always has one, which `BookPageType` answers without the optional.
  std::optional<std::string> name() const { return optionalName(); }
  virtual std::optional<std::string> pageDescription() const = 0;
  virtual std::optional<std::string> imageReference() const = 0;
  /// The page as an immutable value, which later changes of a live page don't reach; a snapshot gives a copy
  /// of itself. A page's own class answers the value itself.
  std::unique_ptr<PageSnapshotType> snapshot() const;

 protected:
  // A refined interface answers `name` and `snapshot` in another type, which no virtual function can: so
  // these, which can, stand behind the public ones.
  virtual std::optional<std::string> optionalName() const = 0;
  virtual PageSnapshotType* newSnapshot() const = 0;
};

/// A page as an immutable value.
class MARLET_EXPORT PageSnapshotType : public virtual PageType {
 public:
  /// The page's directory, made anew. Where nothing lies at a URL that it refers to, that is an error or left
  /// out, as the kind of page says; what lies there and can't be read ends the writing of the wrapper with its error.
  virtual FileWrapper fileWrapper() const = 0;

 protected:
  PageSnapshotType* newSnapshot() const override = 0;
};

/// An immutable page of a book.
class MARLET_EXPORT BookPageSnapshotType : public virtual PageSnapshotType {
 public:
  virtual std::string name() const = 0;
  std::string filename() const override = 0;
  /// A live page with what the snapshot holds.
  virtual std::unique_ptr<BookPageType> convertToMutablePage() const = 0;
  std::unique_ptr<BookPageSnapshotType> snapshot() const {
    return std::unique_ptr<BookPageSnapshotType>(newSnapshot());
  }

 protected:
  std::optional<std::string> optionalName() const final { return name(); }
  BookPageSnapshotType* newSnapshot() const override = 0;
};

/// A live page of a book.
class MARLET_EXPORT BookPageType : public virtual PageType {
 public:
  virtual std::string name() const = 0;
  std::string filename() const override = 0;
  std::unique_ptr<BookPageSnapshotType> snapshot() const {
    return std::unique_ptr<BookPageSnapshotType>(newSnapshot());
  }

 protected:
  std::optional<std::string> optionalName() const final { return name(); }
  BookPageSnapshotType* newSnapshot() const override = 0;
};

/// A page with code.
class MARLET_EXPORT MarletPageType : public virtual PageType {
 public:
  /// The source: left, to be edited in place, of a live page; right of a snapshot.
  using Contents =
      Either<std::reference_wrapper<std::u16string>, std::reference_wrapper<const std::u16string>>;

  virtual Contents contents() const = 0;
  virtual const MarletResultInfoType& resultInfo() const = 0;
  virtual std::optional<URL> sourcesDirectoryURL() const = 0;
  virtual std::optional<URL> resourcesDirectoryURL() const = 0;
  virtual std::optional<URL> liveViewSourceFileURL() const = 0;
  virtual LiveViewMode liveViewMode() const = 0;
  /// Whether the live view fills the whole area.
  virtual bool liveViewEdgeToEdge() const = 0;
  /// The image that stands in for the live view.
  virtual std::optional<std::string> posterReference() const = 0;
  virtual MarletLoggingMode marletLoggingMode() const = 0;
  virtual const std::vector<MarletHint>& hints() const = 0;
  /// Whether the page has passed at some time.
  virtual bool passed() const {
    const auto& assessment = resultInfo().assessmentInformation();
    return assessment && assessment->everPassed;
  }
};

/// A live page with code. The text and the record are objects of their own to which the page refers: a page
/// keeps the same two for good, and they are edited through a constant page, too.
class MARLET_EXPORT MutableMarletPageType : public virtual MarletPageType {
 public:
  virtual std::u16string& text() const = 0;
  MarletResultInfo& resultInfo() const override = 0;
  Contents contents() const override { return Contents::left(text()); }
};

/// An immutable page with code.
class MARLET_EXPORT MarletPageSnapshotType : public virtual MarletPageType, public virtual PageSnapshotType {
 public:
  virtual const std::u16string& text() const = 0;
  const MarletResultInfoSnapshot& resultInfo() const override = 0;
  Contents contents() const override { return Contents::right(text()); }
};

/// A page that shows a prepared asset.
class MARLET_EXPORT CutscenePageType : public virtual PageType {
 public:
  /// A path inside the page's resources.
  virtual std::string cutsceneAssetReference() const = 0;
  virtual std::optional<URL> resourcesDirectoryURL() const = 0;
  virtual std::optional<std::string> posterReference() const = 0;
};

/// An immutable page that shows a prepared asset.
class MARLET_EXPORT CutscenePageSnapshotType : public virtual CutscenePageType,
                                               public virtual PageSnapshotType {};

inline std::unique_ptr<PageSnapshotType> PageType::snapshot() const {
  return std::unique_ptr<PageSnapshotType>(newSnapshot());
}

}  // namespace MarletFoundation
