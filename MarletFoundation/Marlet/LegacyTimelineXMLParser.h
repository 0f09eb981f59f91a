#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "MarletFoundation/Platform/XMLParser.h"

namespace MarletFoundation {

/// Reads the items of a timeline file. Whatever can't be read leaves a field at its default. One object serves
/// one parse.
class MARLET_EXPORT LegacyTimelineXMLParser final : private XMLParser::Delegate {
 public:
  struct DocumentLocation {
    std::int64_t line;
    std::int64_t characterLocation;
    bool operator==(const DocumentLocation&) const = default;
  };
  struct LockedSize {
    double width;
    double height;
    bool operator==(const LockedSize&) const = default;
  };
  struct DataItem {
    std::optional<DocumentLocation> documentLocation;
    std::optional<LockedSize> lockedSize;
    std::int64_t selectedRepresentationIndex = 0;
    bool shouldTrackSuperviewWidth = false;
    bool operator==(const DataItem&) const = default;
  };

  explicit LegacyTimelineXMLParser(Data data);
  LegacyTimelineXMLParser(const LegacyTimelineXMLParser&) = delete;
  LegacyTimelineXMLParser& operator=(const LegacyTimelineXMLParser&) = delete;

  /// The items in their order; those in front of the place where the file ends to be XML.
  std::vector<DataItem> parsedResults();

 private:
  void didStartElement(XMLParser&, const std::string& name, const XMLParser::Attributes& attributes) override;
  void didEndElement(XMLParser&, const std::string& name) override;

  DataItem currentItem_;
  std::vector<DataItem> collectedValues_;
  XMLParser parser_;
};

}  // namespace MarletFoundation
