#include "MarletFoundation/Marlet/MarletResultInfoSnapshot.h"

#include "MarletFoundation/Logging/Log.h"
#include "MarletFoundation/Marlet/DocumentLog.h"
#include "MarletFoundation/Marlet/LegacyTimelineFormat.h"
#include "MarletFoundation/Marlet/LoadChecks.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Version/ManifestVersion.h"

namespace MarletFoundation {
namespace {

using E = MarletResultInfoSnapshot::SerializationError;
using Case = MarletResultInfoSnapshot::SerializationErrorCase;

void checkVersion(const PropertyListDictionary& root) {
  const auto version = requiredString<E>(root, "Version", Case::missingVersion);
  switch (judgeManifestVersion(version)) {
    case ManifestVersionVerdict::readable:
      return;
    case ManifestVersionVerdict::invalid:
      throw E(Case::invalidVersion, version);
    case ManifestVersionVerdict::tooNew:
      throw E(Case::versionTooNew, version);
  }
}

void print(const InlineResults& results) {
  if (const auto& diagnostics = HostEnvironment::current().diagnostics) diagnostics(description(results));
}

/// Bad results are no reason to refuse a page: all of them are given up.
InlineResults readInlineResults(const PropertyListValue::Array& records) {
  InlineResults results;
  try {
    for (const auto& record : records) {
      MarletInlineResultData result(record);
      results.insert_or_assign(result.line, std::move(result));
    }
  } catch (const MarletInlineResultData::SerializationError& error) {
    Log(
        [&] {
          return "Unable to import inline results from marlet. Ignoring. Error: " + error.description();
        },
        documentLogAspect(), LogLevel::Critical);
    return {};
  }
  print(results);
  return results;
}

}  // namespace

const ErrorTable& errorTable(Case) {
  static constexpr ErrorRow rows[] = {{"invalidVersion"},
                                      {"versionTooNew"},
                                      {"assessmentInformationInvalid"},
                                      {"rootNotADictionary"},
                                      {"missingVersion"}};
  static constexpr ErrorTable table{"MarletFoundation.MarletResultInfoSnapshot.SerializationError", rows};
  return table;
}

MarletResultInfoSnapshot::MarletResultInfoSnapshot(const Data& data, Format format) {
  switch (format) {
    case Format::ResultInfo:
      readResultInfo(data);
      break;
    case Format::LegacyInlineResultsTimeline:
      inlineResults_ = inlineResultsFromLegacyTimeline(data);
      break;
  }
}

void MarletResultInfoSnapshot::readResultInfo(const Data& data) {
  const auto value = PropertyListSerialization::read(data);
  require<E>(value.dictionary(), Case::rootNotADictionary);
  const auto& root = *value.dictionary();
  checkVersion(root);
  if (const auto* assessment = root.find("AssessmentInformation"))
    assessmentInformation_.emplace(*assessment);
  const auto* records = root.find("InlineResults");
  if (records && records->array()) inlineResults_ = readInlineResults(*records->array());
}

bool MarletResultInfoSnapshot::needsSerialization(Format format) const {
  return !inlineResults_.empty() || (format == Format::ResultInfo && assessmentInformation_);
}

Data MarletResultInfoSnapshot::data(Format format) const {
  if (format == Format::LegacyInlineResultsTimeline) return Data(legacyTimeline(inlineResults_));
  return PropertyListSerialization::write(resultInfo(), PropertyListFormat::binary);
}

PropertyListValue MarletResultInfoSnapshot::resultInfo() const {
  PropertyListDictionary root{{"Version", "1.0"}};
  if (assessmentInformation_) root["AssessmentInformation"] = assessmentInformation_->propertyListValue();
  if (!inlineResults_.empty()) {
    print(inlineResults_);
    PropertyListValue::Array records;
    records.reserve(inlineResults_.size());
    for (const auto& [line, result] : inlineResults_) records.push_back(result.propertyListValue());
    root["InlineResults"] = std::move(records);
  }
  return root;
}

}  // namespace MarletFoundation
