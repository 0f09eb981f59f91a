#include <gtest/gtest.h>

#include <limits>
#include <regex>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Marlet/LegacyTimelineXMLParser.h"
#include "MarletFoundation/Marlet/MarletResultInfo.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"

namespace MarletFoundation {

void PrintTo(const MarletInlineResultData& result, std::ostream* out) { *out << description(result); }

}  // namespace MarletFoundation

namespace MarletFoundation::test {
namespace {

using D = PropertyListDictionary;
using A = PropertyListValue::Array;
using Record = MarletInlineResultData;
using Snapshot = MarletResultInfoSnapshot;
using Mode = Record::DisplayMode;
using enum Snapshot::Format;

const Record::VisibleState sized = Record::Visible{Record::AtMost{320, 240}, Mode::graph};
const Record::VisibleState full = Record::Visible{Record::FullWidth{100.9}, Mode::list};
const Record::VisibleState hidden = Record::Hidden{};

InlineResults results(std::initializer_list<Record> records) {
  InlineResults map;
  for (const auto& record : records) map.insert_or_assign(record.line, record);
  return map;
}

Data stored(const PropertyListValue& value) {
  return PropertyListSerialization::write(value, PropertyListFormat::xml);
}

/// Collects what is printed and logged for as long as it lives.
struct Sinks {
  std::vector<std::string> printed, logged;
  const ChangedHost host{[this](HostEnvironment& environment) {
    environment.diagnostics = [this](std::string_view line) { printed.emplace_back(line); };
    environment.systemLog = [this](std::string_view entry) { logged.emplace_back(entry); };
  }};
};

TEST(ResultInfo, storesAllButCharacterOffsets) {
  const Sinks sinks;
  const AssessmentInformation assessment(AssessmentStatus::Pass{"well done"}, false);
  const Snapshot snapshot(assessment, results({{7, 40, sized}, {-3, 1, full}, {5, 2, hidden}}));
  const auto root = PropertyListSerialization::read(snapshot.data(ResultInfo));
  const PropertyListValue expected =
      D{{"Version", "1.0"},
        {"AssessmentInformation", assessment.propertyListValue()},
        {"InlineResults",
         A{D{{"Line", -3}, {"VisibleState", D{{"Type", "FullWidth"}, {"Height", 100.9}, {"Mode", "List"}}}},
           D{{"Line", 5}},
           D{{"Line", 7},
             {"VisibleState",
              D{{"Type", "MaxSize"}, {"Width", 320.0}, {"Height", 240.0}, {"Mode", "Graph"}}}}}}};
  EXPECT_EQ(root, expected);
  EXPECT_TRUE(snapshot.data(ResultInfo).view().starts_with("bplist00"));
  const Snapshot read(snapshot.data(ResultInfo), ResultInfo);
  EXPECT_EQ(read.assessmentInformation(), assessment);
  EXPECT_EQ(read.inlineResults(), results({{7, 0, sized}, {-3, 0, full}, {5, 0, hidden}}));
  EXPECT_EQ(read.snapshot(), read);
  ASSERT_EQ(sinks.printed.size(), 4u);
  EXPECT_EQ(sinks.printed.back(), description(read.inlineResults()));
  EXPECT_EQ(
      description(results({{5, 2, full}, {6, 0, hidden}})),
      "[5: MarletInlineResultData(line: 5, characterOffset: 2, visibleState: visible(size: fullWidth(height: "
      "100.9), mode: list)), 6: MarletInlineResultData(line: 6, characterOffset: 0, visibleState: hidden)]");
}

TEST(ResultInfo, writesOnlyWhatThereIs) {
  const Sinks sinks;
  EXPECT_EQ(PropertyListSerialization::read(Snapshot().data(ResultInfo)),
            PropertyListValue(D{{"Version", "1.0"}}));
  EXPECT_TRUE(sinks.printed.empty());
  const Snapshot assessed(AssessmentInformation(AssessmentStatus::Fail{}, false), {});
  EXPECT_TRUE(assessed.needsSerialization(ResultInfo));
  EXPECT_FALSE(assessed.needsSerialization(LegacyInlineResultsTimeline));
  EXPECT_FALSE(Snapshot().needsSerialization(ResultInfo));
  EXPECT_TRUE(Snapshot({}, results({{1, 0, hidden}})).needsSerialization(LegacyInlineResultsTimeline));
}

TEST(ResultInfo, refusesWrongRootsAndVersions) {
  const struct {
    PropertyListValue value;
    std::string description;
  } cases[] = {
      {A{}, "rootNotADictionary"},
      {D{}, "missingVersion"},
      {D{{"Version", 1}}, "missingVersion"},
      {D{{"Version", "1"}}, R"(invalidVersion("1"))"},
      {D{{"Version", "0.9"}}, R"(invalidVersion("0.9"))"},
      {D{{"Version", "1.-1"}}, R"(invalidVersion("1.-1"))"},
      {D{{"Version", "2.0"}, {"AssessmentInformation", 1}}, R"(versionTooNew("2.0"))"},
      {D{{"Version", "1.99"}, {"AssessmentInformation", 1}}, "rootNotADictionary"},
      {D{{"Version", "1.0.7"}, {"AssessmentInformation", D{{"Status", D{}}}}}, "missingStatus"},
  };
  for (const auto& [value, description] : cases) {
    EXPECT_EQ(failure([&v = value] { Snapshot(stored(v), ResultInfo); }), description);
  }
  EXPECT_THROW(Snapshot(Data(std::string("bplist00")), ResultInfo), ErrorObject);
}

TEST(ResultInfo, badInlineResultsAreGivenUpTogether) {
  const auto visible = [](const PropertyListValue& state) { return D{{"Line", 2}, {"VisibleState", state}}; };
  const std::pair<PropertyListValue, std::string> cases[] = {
      {"x", "rootNotADictionary"},
      {D{{"Line", 2.0}}, "missingLineNumber"},
      // No text reaches so far, and the learner's next line feed would end the process.
      {D{{"Line", std::numeric_limits<std::int64_t>::max()}}, "missingLineNumber"},
      {D{{"Line", std::numeric_limits<std::int64_t>::min()}}, "missingLineNumber"},
      {visible(D{}), "missingDisplayModeForVisibleState"},
      {visible(D{{"Mode", "latest"}}), R"(unknownDisplayMode("latest"))"},
      {visible(D{{"Mode", "List"}}), "missingTypeForVisibleState"},
      {visible(D{{"Mode", "List"}, {"Type", "x"}}), R"(unknownTypeForVisibleState("x"))"},
      {visible(D{{"Mode", "List"}, {"Type", "MaxSize"}, {"Width", 1}, {"Height", 1}}),
       "missingWidthForVisibleState"},
      {visible(D{{"Mode", "List"}, {"Type", "MaxSize"}, {"Width", 1.0}}), "missingHeightForVisibleState"},
      {visible(D{{"Mode", "List"}, {"Type", "FullWidth"}, {"Height", 1}}), "missingHeightForVisibleState"},
  };
  const AssessmentInformation assessment(AssessmentStatus::Pass{}, false);
  for (const auto& [record, description] : cases) {
    const Sinks sinks;
    const Snapshot read(stored(D{{"Version", "1.0"},
                                 {"AssessmentInformation", assessment.propertyListValue()},
                                 {"InlineResults", A{D{{"Line", 1}}, record}}}),
                        ResultInfo);
    EXPECT_EQ(read, Snapshot(assessment, {})) << description;
    EXPECT_TRUE(sinks.printed.empty());
    ASSERT_EQ(sinks.logged.size(), 1u) << description;
    EXPECT_TRUE(sinks.logged[0].ends_with(
        "MarletFoundation: Unable to import inline results from marlet. Ignoring. Error: " + description))
        << sinks.logged[0];
  }
}

TEST(ResultInfo, tolerantShapes) {
  const Sinks sinks;
  const auto read = [](const PropertyListValue& records) {
    return Snapshot(stored(D{{"Version", "1.0"}, {"InlineResults", records}}), ResultInfo).inlineResults();
  };
  EXPECT_TRUE(read("x").empty());
  EXPECT_EQ(read(A{D{{"Line", 1}, {"VisibleState", "x"}}}), results({{1, 0, hidden}}));
  EXPECT_EQ(
      read(A{D{{"Line", 1}, {"VisibleState", D{{"Type", "FullWidth"}, {"Height", 2.0}, {"Mode", "Latest"}}}},
             D{{"Line", 1}}}),
      results({{1, 0, hidden}}));
}

TEST(LegacyTimeline, writesTheOldText) {
  const Snapshot snapshot({}, results({{9, 12, sized}, {2, 3, hidden}, {5, 4, full}}));
  const auto text = std::regex_replace(std::string(snapshot.data(LegacyInlineResultsTimeline).view()),
                                       std::regex("Timestamp=[0-9]+\\.[0-9]+\""), "Timestamp=T\"");
  const std::string tail = "></LoggerValueHistoryTimelineItem>";
  const auto head = [](const std::string& offset, const std::string& line) {
    return "<LoggerValueHistoryTimelineItem documentLocation = \"#CharacterRangeLoc=" + offset +
           "&amp;EndingLineNumber=" + line + "&amp;StartingLineNumber=" + line + "&amp;Timestamp=T\" ";
  };
  EXPECT_EQ(
      text,
      "<?xml version=\"1.0\" encoding=\"UTF-8\"?><Timeline version = \"3.0\"><TimelineItems>\n" +
          head("3", "2") + R"(shouldTrackSuperviewWidth = "NO" selectedRepresentationIndex = "0")" + tail +
          "\n" + head("4", "5") +
          R"(lockedSize = "{1024, 100}" shouldTrackSuperviewWidth = "YES" selectedRepresentationIndex = "2")" +
          tail + "\n" + head("12", "9") +
          R"(lockedSize = "{320, 240}" shouldTrackSuperviewWidth = "NO" selectedRepresentationIndex = "1")" +
          tail + "</TimelineItems></Timeline>\n");
  const Snapshot read(snapshot.data(LegacyInlineResultsTimeline), LegacyInlineResultsTimeline);
  EXPECT_EQ(
      read.inlineResults(),
      results({{9, 12, sized}, {2, 3, hidden}, {5, 4, Record::Visible{Record::FullWidth{100}, Mode::list}}}));
  EXPECT_EQ(Snapshot().data(LegacyInlineResultsTimeline).view(),
            "<?xml version=\"1.0\" encoding=\"UTF-8\"?><Timeline version = \"3.0\"><TimelineItems>\n"
            "</TimelineItems></Timeline>\n");
}

TEST(LegacyTimeline, sizesThatDoNotFitAreClamped) {
  const auto size = [](double width, double height) {
    const auto text =
        Record(0, 0, Record::Visible{Record::AtMost{width, height}, Mode::latest}).legacyTimelineItemString();
    const auto start = text.find('{');
    return text.substr(start, text.find('}') - start + 1);
  };
  EXPECT_EQ(size(1e300, -1e300), "{9223372036854775807, -9223372036854775808}");
  EXPECT_EQ(size(std::numeric_limits<double>::quiet_NaN(), -1.9), "{0, -1}");
}

TEST(LegacyTimeline, readsWhatItCan) {
  using Item = LegacyTimelineXMLParser::DataItem;
  const auto item = [](std::optional<LegacyTimelineXMLParser::DocumentLocation> location,
                       std::optional<LegacyTimelineXMLParser::LockedSize> size = {}, std::int64_t index = 0,
                       bool tracksWidth = false) {
    return Item{location, size, index, tracksWidth};
  };
  const std::pair<std::string, Item> cases[] = {
      {"", {}},
      {"documentLocation='#CharacterRangeLoc=12&amp;EndingLineNumber=3&amp;StartingLineNumber=4'",
       item({{4, 12}})},
      {"documentLocation='#CharacterRangeLoc=12&amp;EndingLineNumber=3'", {}},
      {"documentLocation='CharacterRangeLoc=9223372036854775808&amp;StartingLineNumber=4'", {}},
      {"lockedSize='{320.5, 240}'", item({}, {{5, 240}})},
      {"lockedSize='{320, }'", {}},
      {"lockedSize='{-3,4} 5,6'", item({}, {{3, 4}})},
      {"selectedRepresentationIndex='-2' shouldTrackSuperviewWidth='yEs'", item({}, {}, -2, true)},
      {"selectedRepresentationIndex='2x' shouldTrackSuperviewWidth='1'", {}},
  };
  std::string document = "<Timeline>";
  for (const auto& [attributes, expected] : cases)
    document += "<other><LoggerValueHistoryTimelineItem " + attributes + "/></other>";
  const auto items = LegacyTimelineXMLParser(Data(document + "<broken")).parsedResults();
  ASSERT_EQ(items.size(), std::size(cases));
  for (std::size_t i = 0; i < items.size(); ++i) EXPECT_EQ(items[i], cases[i].second) << cases[i].first;
  EXPECT_TRUE(LegacyTimelineXMLParser(Data(std::string("no XML"))).parsedResults().empty());
  const auto digits =
      "<a><LoggerValueHistoryTimelineItem lockedSize='" + std::string(1 << 20, '1') + "'/></a>";
  EXPECT_EQ(LegacyTimelineXMLParser(Data(digits)).parsedResults(), std::vector<Item>(1));
}

TEST(LegacyTimeline, anItemWithoutASizeIsHidden) {
  const auto read = [](const std::string& attributes) {
    return Snapshot(
               Data("<T><LoggerValueHistoryTimelineItem documentLocation='CharacterRangeLoc=1&amp;"
                    "StartingLineNumber=9223372036854775807'/>"
                    "<LoggerValueHistoryTimelineItem documentLocation='CharacterRangeLoc=9223372036854775807"
                    "&amp;StartingLineNumber=3'/>"
                    "<LoggerValueHistoryTimelineItem documentLocation='CharacterRangeLoc=1&amp;"
                    "StartingLineNumber=2' " +
                    attributes + "/><LoggerValueHistoryTimelineItem lockedSize='1,2'/></T>"),
               LegacyInlineResultsTimeline)
        .inlineResults();
  };
  EXPECT_EQ(read("shouldTrackSuperviewWidth='YES'"), results({{2, 1, hidden}}));
  EXPECT_EQ(read("lockedSize='3,4' selectedRepresentationIndex='7'"),
            results({{2, 1, Record::Visible{Record::AtMost{3, 4}, Mode::latest}}}));
}

TEST(MarletResultInfo, aRunPrunesWhatItDidNotReportAgain) {
  MarletResultInfo info(Snapshot({}, results({{1, 0, sized}, {2, 0, full}})));
  info.executionDidBegin();
  info.trackInlineResultDataAt(2, 9);
  info.trackInlineResultDataAt(3, 5);
  EXPECT_EQ(info.snapshot().inlineResults(), results({{1, 0, sized}, {2, 9, full}, {3, 5, hidden}}));
  info.executionDidBegin();
  EXPECT_EQ(info.inlineResults(), results({{2, 9, full}, {3, 5, hidden}}));
  info.updateForTextInsertion("x", {9, 0}, 0);
  info.executionDidBegin();
  EXPECT_EQ(info.inlineResults().size(), 2u);
  info.updateForTextDeletion("x", {{9, 0}, {9, 1}}, {0, 1});
  info.executionDidBegin();
  EXPECT_EQ(info.inlineResults().size(), 2u);
}

TEST(MarletResultInfo, recordsMoveWithInsertions) {
  const auto inserted = [](std::string_view text, SourceEditorPosition position, std::int64_t offset) {
    MarletResultInfo info(Snapshot({}, results({{4, 10, full}, {5, 20, sized}, {6, 30, hidden}})));
    info.updateForTextInsertion(text, position, offset);
    return info.inlineResults();
  };
  EXPECT_EQ(inserted("\n", {5, 0}, 18), results({{4, 10, full}, {6, 21, sized}, {7, 31, hidden}}));
  EXPECT_EQ(inserted("\n", {5, 3}, 20), results({{4, 10, full}, {5, 21, sized}, {7, 31, hidden}}));
  EXPECT_EQ(inserted("\n", {5, 3}, 21), results({{4, 10, full}, {5, 20, sized}, {7, 31, hidden}}));
  // One character each: a line feed, CR LF, which is no line feed, and a letter with its accent.
  EXPECT_EQ(inserted("\n\r\ne\u0301", {5, 0}, 0), results({{4, 10, full}, {6, 23, sized}, {7, 33, hidden}}));
}

TEST(MarletResultInfo, recordsMoveWithDeletions) {
  const auto deleted = [](std::string_view text, SourceEditorRange range, std::int64_t location) {
    MarletResultInfo info(
        Snapshot({}, results({{2, 1, full}, {3, 10, full}, {4, 20, full}, {5, 30, sized}, {6, 40, hidden}})));
    info.updateForTextDeletion(text, range, {location, 0});
    return info.inlineResults();
  };
  EXPECT_EQ(deleted("abc", {{3, 0}, {5, 2}}, 10), results({{2, 1, full}, {5, 27, sized}, {4, 37, hidden}}));
  EXPECT_EQ(deleted("abc", {{5, 0}, {5, 3}}, 31),
            results({{2, 1, full}, {3, 10, full}, {4, 20, full}, {5, 30, sized}, {6, 37, hidden}}));
}

TEST(MarletResultInfo, tellsWhetherTheAssessmentChanged) {
  MarletResultInfo info;
  const AssessmentInformation failed(AssessmentStatus::Fail{}, false),
      failedLater(AssessmentStatus::Fail{}, true);
  EXPECT_FALSE(info.updateAssessmentInformation(std::nullopt));
  EXPECT_TRUE(info.updateAssessmentInformation(failed));
  EXPECT_FALSE(info.updateAssessmentInformation(failed));
  EXPECT_TRUE(info.updateAssessmentInformation(failedLater));
  EXPECT_EQ(info.assessmentInformation(), failedLater);
  EXPECT_TRUE(info.updateAssessmentInformation(std::nullopt));
  EXPECT_EQ(info.assessmentInformation(), std::nullopt);
}

}  // namespace
}  // namespace MarletFoundation::test
