#include "MarletFoundation/Marlet/MarletKeyValueStore.h"

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Version/ManifestVersion.h"

namespace MarletFoundation {

using Case = MarletKeyValueStoreSnapshot::SerializationErrorCase;

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {
      {"InvalidPlist"},  {"WrapperNotADictionary"}, {"MissingVersion"},         {"InvalidVersion"},
      {"VersionTooNew"}, {"MissingContents"},       {"ContentsNotADictionary"},
  };
  static constexpr ErrorTable table{"MarletFoundation.MarletKeyValueStoreSnapshot.SerializationError", rows};
  return table;
}

MarletKeyValueStoreSnapshot::MarletKeyValueStoreSnapshot(const Data& plistData) {
  PropertyListValue root;
  try {
    root = fromPropertyListData<PropertyListValue>(plistData);
  } catch (const Error& error) {
    throw SerializationError(Case::InvalidPlist, error);
  }
  require<SerializationError>(root.dictionary(), Case::WrapperNotADictionary);
  const auto version =
      requiredString<SerializationError>(*root.dictionary(), "Version", Case::MissingVersion);
  const auto verdict = judgeManifestVersion(version);
  require<SerializationError>(verdict != ManifestVersionVerdict::invalid, Case::InvalidVersion);
  require<SerializationError>(verdict != ManifestVersionVerdict::tooNew, Case::VersionTooNew);
  auto* const contents = std::get<PropertyListDictionary>(root.payload).find("Contents");
  require<SerializationError>(contents, Case::MissingContents);
  require<SerializationError>(contents->dictionary(), Case::ContentsNotADictionary);
  contents_ = std::get<PropertyListDictionary>(std::move(contents->payload));
}

MarletKeyValueStoreSnapshot::MarletKeyValueStoreSnapshot(const MarletKeyValueStore& store)
    : contents_(store.contents()) {}

Data MarletKeyValueStoreSnapshot::plistData() const {
  PropertyListDictionary root{{"Version", CurrentManifestVersionString}};
  root["Contents"] = contents_;
  return PropertyListSerialization::write(std::move(root), PropertyListFormat::binary);
}

}  // namespace MarletFoundation
