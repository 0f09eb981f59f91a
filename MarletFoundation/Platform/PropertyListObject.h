#pragma once

#include <list>
#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>
#include <variant>
#include <vector>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/Date.h"

namespace MarletFoundation {

class PropertyListObject;
/// Objects are immutable and shared.
using PropertyListObjectPointer = std::shared_ptr<const PropertyListObject>;
using PropertyListObjects = std::vector<PropertyListObjectPointer>;
/// A list of one: a container that lies too deep to be destroyed on the stack hands on what it holds, which may need
/// no memory.
using ContainedPropertyListObjects = std::list<PropertyListObjects>;

/// An untyped object, as a reader makes it or a host hands it over. The class tells the kind; a host may add
/// kinds of its own. Objects nested ever so deep are compared and destroyed without using up the stack.
class MARLET_EXPORT PropertyListObject {
 public:
  virtual ~PropertyListObject() = default;
  /// Whether both are of the same kind with equal contents. Equal objects have equal hashes.
  virtual bool isEqual(const PropertyListObject& other) const = 0;
  virtual std::size_t hash() const = 0;
};

class MARLET_EXPORT StringObject final : public PropertyListObject {
 public:
  const std::string value;
  explicit StringObject(std::string text) : value(std::move(text)) {}
  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;
};

class MARLET_EXPORT DataObject final : public PropertyListObject {
 public:
  const Data value;
  explicit DataObject(Data data) : value(std::move(data)) {}
  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;
};

class MARLET_EXPORT DateObject final : public PropertyListObject {
 public:
  const Date value;
  explicit DateObject(Date date) : value(date) {}
  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;
};

/// A number that reports by a type code what it was made from: "c" for a boolean, "q" for an integer, "d" for
/// a real, or the code that its maker gave. Numbers are equal by value, whatever their codes.
class MARLET_EXPORT NumberObject final : public PropertyListObject {
 public:
  using Value = std::variant<std::int64_t, std::uint64_t, double>;

  static PropertyListObjectPointer boolean(bool value);
  static PropertyListObjectPointer integer(std::int64_t value);
  static PropertyListObjectPointer real(double value);
  NumberObject(std::string typeCode, Value value) : typeCode_(std::move(typeCode)), value_(value) {}

  const std::string& typeCode() const { return typeCode_; }
  /// True for everything but 0.
  bool boolValue() const;
  /// Reals are cut to whole numbers and clamped, unsigned numbers keep their bits.
  std::int64_t integerValue() const;
  double doubleValue() const;

  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;

 private:
  std::string typeCode_;
  Value value_;
};

class MARLET_EXPORT ArrayObject final : public PropertyListObject {
 public:
  explicit ArrayObject(PropertyListObjects objects) { objects_.push_back(std::move(objects)); }
  ~ArrayObject() override;
  const PropertyListObjects& objects() const { return objects_.front(); }
  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;

 private:
  ContainedPropertyListObjects objects_;
};

/// Gives one object after another, then null.
class MARLET_EXPORT ObjectEnumerator {
 public:
  explicit ObjectEnumerator(PropertyListObjects objects) : objects_(std::move(objects)) {}
  PropertyListObjectPointer nextObject() { return next_ < objects_.size() ? objects_[next_++] : nullptr; }

 private:
  PropertyListObjects objects_;
  std::size_t next_ = 0;
};

/// A dictionary from any object to any object.
class MARLET_EXPORT DictionaryObject : public PropertyListObject {
 public:
  virtual std::size_t count() const = 0;
  /// The object under an equal key, or null.
  virtual PropertyListObjectPointer objectForKey(const PropertyListObject& key) const = 0;
  virtual bool isEqualToDictionary(const DictionaryObject& other) const = 0;
  virtual PropertyListObjects allKeys() const = 0;
  virtual PropertyListObjects allValues() const = 0;
  virtual ObjectEnumerator keyEnumerator() const { return ObjectEnumerator(allKeys()); }
  virtual ObjectEnumerator objectEnumerator() const { return ObjectEnumerator(allValues()); }

  bool isEqual(const PropertyListObject& other) const override;
  std::size_t hash() const override;
};

/// A dictionary that keeps its entries in the order in which they were given.
class MARLET_EXPORT PlainDictionary final : public DictionaryObject {
 public:
  /// As many objects as keys. Of equal keys the last object wins, in the place of the first.
  PlainDictionary(const PropertyListObjects& objects, const PropertyListObjects& keys);
  ~PlainDictionary() override;

  std::size_t count() const override { return keys_.front().size(); }
  PropertyListObjectPointer objectForKey(const PropertyListObject& key) const override;
  bool isEqualToDictionary(const DictionaryObject& other) const override;
  PropertyListObjects allKeys() const override { return keys_.front(); }
  PropertyListObjects allValues() const override { return values_.front(); }

 private:
  struct KeyHash {
    std::size_t operator()(const PropertyListObject* key) const { return key->hash(); }
  };
  struct KeyEqual {
    bool operator()(const PropertyListObject* a, const PropertyListObject* b) const { return a->isEqual(*b); }
  };

  ContainedPropertyListObjects keys_{1};
  ContainedPropertyListObjects values_{1};
  std::unordered_map<const PropertyListObject*, std::size_t, KeyHash, KeyEqual> places_;
};

/// What a dictionary value becomes on its way to a writer: its keys are walked in ascending order. Only they
/// are sorted: the values keep the order of the underlying dictionary and don't line up with the keys.
class MARLET_EXPORT MLFSortedDictionary final : public DictionaryObject {
 public:
  MLFSortedDictionary(const PropertyListObjects& objects, const PropertyListObjects& keys);
  /// Takes a copy of `dictionary`.
  explicit MLFSortedDictionary(const DictionaryObject& dictionary);

  std::size_t count() const override { return _underlyingDictionary.count(); }
  PropertyListObjectPointer objectForKey(const PropertyListObject& key) const override {
    return _underlyingDictionary.objectForKey(key);
  }
  bool isEqualToDictionary(const DictionaryObject& other) const override {
    return _underlyingDictionary.isEqualToDictionary(other);
  }
  /// Strings by code point, before them numbers by value and dates; other kinds last, as they come.
  PropertyListObjects allKeys() const override;
  PropertyListObjects allValues() const override { return _underlyingDictionary.allValues(); }

 private:
  PlainDictionary _underlyingDictionary;
};

/// Reads a property list in either form into objects: plain dictionaries, numbers with type codes "c", "q"
/// and "d". Throws an `ErrorObject` of `PropertyListErrorDomain`.
MARLET_EXPORT PropertyListObjectPointer readPropertyListObject(const Data& data);

}  // namespace MarletFoundation
