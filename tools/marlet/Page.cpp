#include "Page.h"

#include <iostream>

#include "Document.h"
#include "Guarded.h"
#include "JSON.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "PageJSON.h"
#include "SafeOutput.h"

using namespace MarletFoundation;

namespace {

/// The source as it stands: text goes to programs, too, so nothing of it is escaped.
std::string sourceOf(const MarletPageSnapshotType& page) { return utf8FromUTF16Lossy(page.text()); }

void printAssessment(const AssessmentInformation& assessment, const Terminal& terminal) {
  const auto print = [](const std::string& line) { std::cout << printable(line) << "\n"; };
  if (const auto* pass = std::get_if<AssessmentStatus::Pass>(&assessment.currentStatus.outcome)) {
    std::cout << terminal.styled(Terminal::Style::green, "✓ passed");
    if (pass->message) std::cout << ": " << printable(*pass->message);
    std::cout << "\n";
    return;
  }
  const auto& fail = std::get<AssessmentStatus::Fail>(assessment.currentStatus.outcome);
  print(assessment.everPassed ? "· not passed this time, but before" : "· not passed yet");
  for (const auto& hint : fail.hints) print("  try: " + hint);
}

void printHints(const std::vector<MarletHint>& hints) {
  for (const auto& hint : hints) {
    const auto* hidden = std::get_if<MarletHint::HiddenWithSpoilerInstruction>(&hint.presentationType);
    // What a button hides stays hidden here as well.
    std::cout << "? "
              << (hidden ? "[" + printable(hidden->title) + "]" : printable(hint.markupContent.text()))
              << "\n";
  }
}

void printLines(const std::string& source) {
  for (const auto line : split(source.ends_with('\n') ? std::string_view(source).substr(0, source.size() - 1)
                                                      : std::string_view(source),
                               '\n'))
    std::cout << "  " << printable(line) << "\n";
}

void printSummary(const BookPageSnapshotType& page, const Terminal& terminal) {
  std::cout << terminal.styled(Terminal::Style::bold, printable(page.name())) << " "
            << terminal.styled(Terminal::Style::dim, printable(page.filename())) << "\n";
  if (const auto description = page.pageDescription()) std::cout << printable(*description) << "\n";
  if (const auto* cutscene = dynamic_cast<const CutscenePageType*>(&page))
    std::cout << "shows " << printable(cutscene->cutsceneAssetReference()) << "\n";
  const auto* code = dynamic_cast<const MarletPageSnapshotType*>(&page);
  if (!code) return;
  const auto& assessment = code->resultInfo().assessmentInformation();
  if (assessment) printAssessment(*assessment, terminal);
  printHints(code->hints());
  std::cout << "\n";
  printLines(sourceOf(*code));
}

}  // namespace

ExitStatus showPage(const std::string& book, const std::string& chapter, const std::string& page,
                    PageOutput output, const Terminal& terminal) {
  return guarded(book + ": " + chapter + ": " + page, terminal, [&] {
    const auto open = [&] {
      return orFailWith(ExitStatus::unreadablePath, book, [&] { return Document(book); });
    };
    const auto fetched = readOneState(book, open, [&](const Document& document) {
      std::optional<DiffPackSnapshot> pack;
      const MarletBookSnapshot snapshot(document.wrapper, document.url, pack);
      return snapshotForPageWithFilename(page, chapter, document.url, &snapshot, pack);
    });
    const auto* code = dynamic_cast<const MarletPageSnapshotType*>(fetched.get());
    if (output == PageOutput::summary) {
      printSummary(*fetched, terminal);
    } else if (output == PageOutput::json) {
      std::cout << dumped(json(*fetched)) << "\n";
    } else if (code) {
      printText(sourceOf(*code));
    } else {
      throw CommandFailure{ExitStatus::negative, page + ": A page of this kind has no source."};
    }
    return ExitStatus::good;
  });
}
