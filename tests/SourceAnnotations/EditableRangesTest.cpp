#include "MarletFoundation/SourceAnnotations/EditableRanges.h"

#include <gtest/gtest.h>
#include <rapidcheck/gtest.h>

#include <algorithm>

#include "Dump.h"

namespace MarletFoundation::test {
namespace {

std::string dumpOf(const std::vector<TextRange>& ranges) {
  std::string text;
  for (const auto& range : ranges) text += (text.empty() ? "" : " ") + dump(range);
  return text;
}

TEST(EditableRanges, ofTexts) {
  const std::pair<std::string, std::string> rows[] = {
      {"", "0+0"},
      {"abc\n", "0+4"},
      {"//#-bogus\nabc", "0+13"},
      // What lies between the field's lines.
      {"a\n//#-editable-code\nbc\r\n//#-end-editable-code\nd", "20+4"},
      {"a = /*#-editable-code*/\"x\"/*#-end-editable-code*/", "24+1"},
      {"a = /*#-editable-code*/x/*#-end-editable-code*/", "23+1"},
      // One quote for both insets.
      {"/*#-editable-code*/\"/*#-end-editable-code*/", "20+-1"},
      // Without fields: the gaps between what is hidden.
      {"a\n//#-hidden-code\nb\n//#-end-hidden-code\nc", "0+2 40+1"},
      {"//#-code-completion(module, show)\nabc", "0+0 34+3"},
      {"a\n//#-copy-source(x)\nb\n//#-end-copy-source\nc", "0+2 21+2 43+1"},
      // A copy source's lines are cut out of a field: first the part behind, then the part in front.
      {"//#-editable-code\na\n//#-copy-source(x)\nb\n//#-end-copy-source\nc\n//#-end-editable-code",
       "61+2 39+2 18+2"},
      // A field's end that has no start ends what the last tag began.
      {"/*#-editable-code*/ab/*#-end-editable-code*/\n//#-copy-source(x)\n//#-end-editable-code",
       "19+2 19+26"},
      // All of the field is hidden, so the rest of the text is editable.
      {"/*#-editable-code*/ab/*#-end-editable-code*/\n//#-end-hidden-code\nrest", "65+4"},
  };
  for (const auto& [text, ranges] : rows) EXPECT_EQ(dumpOf(editableRanges(wide(text))), ranges) << text;
}

/// The rules line after line, as they are told.
std::vector<TextRange> toldRanges(const std::u16string& text) {
  std::vector<TextRange> editable, hidden;
  std::int64_t start = 0;
  const auto between = [](std::int64_t from, std::int64_t to) { return TextRange{from, to - from}; };
  const auto size = static_cast<std::int64_t>(text.size());
  for (std::size_t at = 0; at < text.size();) {
    const auto lineEnd = std::min(text.find_first_of(u"\n\r\u2029", at), text.size());
    const auto next = std::min(lineEnd + (text.compare(lineEnd, 2, u"\r\n") == 0 ? 2 : 1), text.size());
    const auto line = static_cast<std::int64_t>(at);
    const auto enclosingEnd = static_cast<std::int64_t>(next);
    for (const auto& [range, tag] :
         SourceTag::parseLineForTagsInSourceEditor(text.substr(at, lineEnd - at))) {
      using Case = SourceTag::Case;
      if (tag.kind() == Case::multiLineFieldStart) start = enclosingEnd;
      if (tag.kind() == Case::multiLineFieldEnd)
        editable.push_back(between(std::exchange(start, line), line));
      if (const auto* field = std::get_if<SourceTag::InlineFieldStart>(&tag.payload))
        start = line + range.end() + field->inset;
      if (const auto* end = std::get_if<SourceTag::InlineFieldEnd>(&tag.payload))
        editable.push_back(between(start, line + range.location - end->inset));
      if (tag.kind() == Case::hiddenCodeStart) start = line;
      if (tag.kind() == Case::hiddenCodeEnd)
        hidden.push_back(between(std::exchange(start, enclosingEnd), enclosingEnd));
      if (tag.isCopySource() && tag.isLineTag()) hidden.push_back(between(line, enclosingEnd));
      if (tag.kind() == Case::codeCompletionDirective) hidden.push_back(between(line, start = enclosingEnd));
    }
    at = next;
  }
  if (editable.empty() && !hidden.empty()) {
    std::int64_t cursor = 0;
    for (const auto& range : hidden)
      editable.push_back(between(std::exchange(cursor, range.end()), range.location));
    editable.push_back(between(cursor, size));
    return editable;
  }
  for (const auto& range : hidden) {
    const auto hit = std::find_if(editable.begin(), editable.end(), [&](const TextRange& other) {
      return std::min(range.end(), other.end()) - std::max(range.location, other.location) >= 1;
    });
    if (hit == editable.end()) continue;
    const auto whole = *hit;
    auto place = editable.erase(hit);
    if (whole.location < range.location)
      place = editable.insert(place, between(whole.location, range.location));
    if (whole.end() > range.end()) editable.insert(place, between(range.end(), whole.end()));
  }
  if (editable.empty()) editable.push_back(between(start, size));
  return editable;
}

RC_GTEST_PROP(EditableRanges, followTheRulesOfEachLine, ()) {
  const auto piece = rc::gen::element<std::string>(
      "a", "b\n", "\"", "\r\n", "\u2029", "/*#-editable-code*/",
      "/*#-editable-code*/x/*#-end-editable-code*/", "/*#-end-editable-code*/", "\n//#-editable-code\n",
      "\n//#-end-editable-code\r", "\n//#-hidden-code\n", "\n//#-end-hidden-code\n", "\n//#-copy-source(x)\n",
      "\n//#-end-copy-source\n", "\n//#-code-completion(module, show)\n");
  std::string text;
  for (const auto& next : *rc::gen::container<std::vector<std::string>>(piece)) text += next;
  RC_ASSERT(dumpOf(editableRanges(wide(text))) == dumpOf(toldRanges(wide(text))));
}

TEST(EditableRanges, manyCutsTakeLinearTime) {
  std::string text = "//#-editable-code\n";
  for (int i = 0; i < 100000; ++i) text += "//#-copy-source(x)\na\n";
  text += "//#-end-editable-code\n";
  for (int i = 0; i < 100000; ++i)
    text += "/*#-editable-code*/a/*#-end-editable-code*/\n//#-copy-source(x)\n";
  EXPECT_EQ(editableRanges(wide(text)).size(), 200000u);
}

}  // namespace
}  // namespace MarletFoundation::test
