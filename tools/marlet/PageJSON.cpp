#include "PageJSON.h"

#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"

using namespace MarletFoundation;
using nlohmann::ordered_json;

namespace {

ordered_json json(const MarletHint& hint) {
  const auto* file = std::get_if<MarletHint::FileReference>(&hint.markupContent);
  const auto* hidden = std::get_if<MarletHint::HiddenWithSpoilerInstruction>(&hint.presentationType);
  return {{"content", hint.markupContent.text()},
          {"fileReference", file ? ordered_json(file->reference) : ordered_json(nullptr)},
          {"spoilerButtonTitle", hidden ? ordered_json(hidden->title) : ordered_json(nullptr)}};
}

ordered_json json(const AssessmentInformation& assessment) {
  const auto* pass = std::get_if<AssessmentStatus::Pass>(&assessment.currentStatus.outcome);
  const auto* fail = std::get_if<AssessmentStatus::Fail>(&assessment.currentStatus.outcome);
  return {{"passed", pass != nullptr},
          {"everPassed", assessment.everPassed},
          {"message", pass ? orNull(pass->message) : ordered_json(nullptr)},
          {"hints", fail ? ordered_json(fail->hints) : ordered_json(nullptr)},
          {"solution", fail ? orNull(fail->solution) : ordered_json(nullptr)}};
}

ordered_json json(const MarletInlineResultData::Visible& visible) {
  static constexpr const char* modes[] = {"Latest", "List", "Graph"};
  const auto* atMost = std::get_if<MarletInlineResultData::AtMost>(&visible.size);
  const auto* fullWidth = std::get_if<MarletInlineResultData::FullWidth>(&visible.size);
  return {{"type", atMost ? "MaxSize" : "FullWidth"},
          {"width", atMost ? finiteNumber(atMost->width) : ordered_json(nullptr)},
          {"height", finiteNumber(atMost ? atMost->height : fullWidth->height)},
          {"mode", modes[static_cast<int>(visible.mode)]}};
}

ordered_json json(const MarletResultInfoType& resultInfo) {
  auto results = ordered_json::array();
  for (const auto& [line, result] : resultInfo.inlineResults()) {
    const auto* visible = std::get_if<MarletInlineResultData::Visible>(&result.visibleState);
    results.push_back({{"line", line}, {"visibleState", visible ? json(*visible) : ordered_json(nullptr)}});
  }
  const auto& assessment = resultInfo.assessmentInformation();
  return {{"assessment", assessment ? json(*assessment) : ordered_json(nullptr)},
          {"inlineResults", std::move(results)}};
}

void addCode(ordered_json& object, const MarletBookPageSnapshot& page) {
  auto hints = ordered_json::array();
  for (const auto& hint : page.hints()) hints.push_back(json(hint));
  object["text"] = utf8FromUTF16Lossy(page.text());
  object["liveViewMode"] =
      page.liveViewMode() == LiveViewMode::HiddenByDefault ? "HiddenByDefault" : "VisibleByDefault";
  object["liveViewEdgeToEdge"] = page.liveViewEdgeToEdge();
  object["marletLoggingMode"] = page.marletLoggingMode() == MarletLoggingMode::Normal ? "Normal" : "Off";
  object["hints"] = std::move(hints);
  object["resultInfo"] = json(page.resultInfo());
  object["hasSources"] = page.sourcesDirectoryURL().has_value();
  object["hasResources"] = page.resourcesDirectoryURL().has_value();
  object["hasLiveView"] = page.liveViewSourceFileURL().has_value();
}

}  // namespace

ordered_json json(const BookPageSnapshotType& page) {
  const auto* marletPage = dynamic_cast<const MarletBookPageSnapshot*>(&page);
  const auto* cutscene = dynamic_cast<const CutsceneBookPageSnapshot*>(&page);
  ordered_json object{
      {"kind", marletPage ? "marletpage" : "cutscenepage"},
      {"name", page.name()},
      {"filename", page.filename()},
      {"description", orNull(page.pageDescription())},
      {"imageReference", orNull(page.imageReference())},
      {"posterReference", orNull(marletPage ? marletPage->posterReference() : cutscene->posterReference())}};
  if (marletPage) {
    addCode(object, *marletPage);
  } else {
    object["hasResources"] = cutscene->resourcesDirectoryURL().has_value();
    object["cutsceneReference"] = cutscene->cutsceneAssetReference();
  }
  return object;
}
