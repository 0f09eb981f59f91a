#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Platform/FileWrapper.h"

/// The shapes that the checks of a load have in common. Each throws an error of the type it is given, in the
/// case it is given.
namespace MarletFoundation {

template <class ErrorType>
void require(bool holds, typename ErrorType::Case otherwise) {
  if (!holds) throw ErrorType(otherwise);
}

/// The contents of a child that is there, a regular file, and readable; nothing otherwise.
inline std::optional<Data> fileContents(const FileWrapper& directory, std::string_view name) {
  const auto child = directory.child(name);
  return child && child->isRegularFile() ? child->regularFileContents() : std::nullopt;
}

/// The contents of a file that need not be there, but must be one if it is.
template <class ErrorType>
std::optional<Data> optionalFileContents(const FileWrapper& directory, std::string_view name,
                                         typename ErrorType::Case notAFile) {
  const auto child = directory.child(name);
  if (!child) return std::nullopt;
  auto contents = child->isRegularFile() ? child->regularFileContents() : std::nullopt;
  require<ErrorType>(contents.has_value(), notAFile);
  return contents;
}

/// The root dictionary of the required file "Manifest.plist".
template <class ErrorType>
PropertyListDictionary loadManifest(const FileWrapper& directory, typename ErrorType::Case missing,
                                    typename ErrorType::Case invalid,
                                    typename ErrorType::Case notADictionary) {
  const auto data = fileContents(directory, "Manifest.plist");
  require<ErrorType>(data.has_value(), missing);
  PropertyListValue root;
  try {
    root = fromPropertyListData<PropertyListValue>(*data);
  } catch (const Error& error) {
    throw ErrorType(invalid, error);
  }
  require<ErrorType>(root.dictionary(), notADictionary);
  return std::get<PropertyListDictionary>(std::move(root.payload));
}

/// The string at a required key; a value of another type counts as missing.
template <class ErrorType>
std::string requiredString(const PropertyListDictionary& manifest, std::string_view key,
                           typename ErrorType::Case missing) {
  const auto* value = manifest.find(key);
  require<ErrorType>(value && value->string(), missing);
  return *value->string();
}

/// The string at a required key that tells a value of another type from a missing one.
template <class ErrorType>
std::string requiredString(const PropertyListDictionary& manifest, std::string_view key,
                           typename ErrorType::Case missing, typename ErrorType::Case notAString) {
  const auto* value = manifest.find(key);
  require<ErrorType>(value, missing);
  require<ErrorType>(value->string(), notAString);
  return *value->string();
}

template <class ErrorType>
std::optional<std::string> optionalString(const PropertyListDictionary& manifest, std::string_view key,
                                          typename ErrorType::Case notAString) {
  const auto* value = manifest.find(key);
  if (!value) return std::nullopt;
  require<ErrorType>(value->string(), notAString);
  return *value->string();
}

/// The array at a required key.
template <class ErrorType>
const PropertyListValue::Array& requiredArray(const PropertyListDictionary& manifest, std::string_view key,
                                              typename ErrorType::Case missing,
                                              typename ErrorType::Case notAnArray) {
  const auto* value = manifest.find(key);
  require<ErrorType>(value, missing);
  require<ErrorType>(value->array(), notAnArray);
  return *value->array();
}

/// The URL of a child that is there, whatever it holds. A link counts as absent: it may lead out of the
/// document.
inline std::optional<URL> urlOfChild(const FileWrapper& parent, const URL& parentURL, std::string_view name,
                                     bool isDirectory) {
  const auto child = parent.child(name);
  if (!child || !(child->isDirectory() || child->isRegularFile())) return std::nullopt;
  return parentURL.appendingPathComponent(name, isDirectory);
}

/// The URL of an optional child directory.
template <class ErrorType>
std::optional<URL> optionalDirectory(const FileWrapper& parent, const URL& parentURL, std::string_view name,
                                     typename ErrorType::Case notADirectory) {
  const auto child = parent.child(name);
  if (!child) return std::nullopt;
  require<ErrorType>(child->isDirectory(), notADirectory);
  return parentURL.appendingPathComponent(name, true);
}

/// A required child that is a directory with children.
template <class ErrorType>
FileWrapper requiredDirectory(const FileWrapper& parent, std::string_view name,
                              typename ErrorType::Case missing, typename ErrorType::Case notADirectory) {
  auto child = parent.child(name);
  require<ErrorType>(child.has_value(), missing);
  require<ErrorType>(child->hasChildren(), notADirectory);
  return *std::move(child);
}

/// An image reference: a local path that needs a directory of resources, though not the file itself. A string
/// that is no URL at all passes.
template <class ErrorType>
std::optional<std::string> optionalImageReference(const PropertyListDictionary& manifest,
                                                  const std::optional<URL>& resources,
                                                  typename ErrorType::Case notAString,
                                                  typename ErrorType::Case withNoResources,
                                                  typename ErrorType::Case isAURL) {
  auto reference = optionalString<ErrorType>(manifest, "ImageReference", notAString);
  if (!reference) return std::nullopt;
  require<ErrorType>(resources.has_value(), withNoResources);
  const auto url = URL::parse(*reference);
  require<ErrorType>(!url || !url->scheme(), isAURL);
  return reference;
}

}  // namespace MarletFoundation
