#pragma once

#include "MarletFoundation/Data/CaseError.h"
#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/Data.h"

namespace MarletFoundation {

/// A document's named values, which its running content reads and writes.
class MARLET_EXPORT MarletKeyValueStoreType {
 public:
  virtual ~MarletKeyValueStoreType() = default;
  virtual const PropertyListDictionary& contents() const = 0;
};

class MarletKeyValueStore;

/// The store as an immutable value, with its file form.
class MARLET_EXPORT MarletKeyValueStoreSnapshot final : public MarletKeyValueStoreType {
 public:
  enum class SerializationErrorCase {
    InvalidPlist,
    WrapperNotADictionary,
    MissingVersion,
    InvalidVersion,
    VersionTooNew,
    MissingContents,
    ContentsNotADictionary,
  };
  using SerializationError = CaseError<SerializationErrorCase>;

  MarletKeyValueStoreSnapshot() = default;
  /// Reads the bytes of a "KeyValueStore.plist" in either form of property list; throws `SerializationError`.
  explicit MarletKeyValueStoreSnapshot(const Data& plistData);
  explicit MarletKeyValueStoreSnapshot(const MarletKeyValueStore& store);

  const PropertyListDictionary& contents() const override { return contents_; }
  /// The bytes of the file, a binary property list. The store holds what running content put into it: throws an
  /// `ErrorObject` of `PropertyListErrorDomain` for text that is not valid UTF-8 and dates that aren't finite.
  Data plistData() const;
  /// Whether there is anything to write: an empty store has no file.
  bool needsSerialization() const { return !contents_.empty(); }

 private:
  PropertyListDictionary contents_;
};

MARLET_EXPORT const ErrorTable& errorTable(MarletKeyValueStoreSnapshot::SerializationErrorCase);

/// The store of a live document. Not locked: one thread at a time.
class MARLET_EXPORT MarletKeyValueStore final : public MarletKeyValueStoreType {
 public:
  MarletKeyValueStore() = default;
  explicit MarletKeyValueStore(const MarletKeyValueStoreSnapshot& snapshot)
      : contents_(snapshot.contents()) {}

  const PropertyListDictionary& contents() const override { return contents_; }
  void setContents(PropertyListDictionary contents) { contents_ = std::move(contents); }
  /// Sets one key; the others stay where they are.
  void setValue(std::string_view key, PropertyListValue value) { contents_[key] = std::move(value); }
  /// Removes one key. True when it was there.
  bool removeValue(std::string_view key) { return contents_.erase(key); }
  MarletKeyValueStoreSnapshot snapshot() const { return MarletKeyValueStoreSnapshot(*this); }

 private:
  PropertyListDictionary contents_;
};

}  // namespace MarletFoundation
