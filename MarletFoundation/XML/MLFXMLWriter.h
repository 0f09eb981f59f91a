#pragma once

#include <exception>
#include <functional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/URL.h"

struct _xmlDoc;
struct _xmlError;
struct _xmlTextWriter;

namespace MarletFoundation {

class MLFXMLElement;
using MLFXMLElementWriter = std::function<void(MLFXMLElement&)>;
/// Names and values in the order in which they are written; each name once.
using MLFXMLAttributes = std::vector<std::pair<std::string, std::string>>;

/// What takes comments. Here and in the interfaces below, an `ErrorObject` of `MarletSerializationErrorDomain`
/// refuses what can't be written: names that are none (one prefix is fine, declared or not), control characters,
/// ill-formed UTF-8, "--" in a comment, more than 8 MiB in one piece or in texts that follow each other, more than
/// 256 levels of elements. What only libxml2 finds, such as an attribute that is there twice, may be thrown by a
/// later call, and at the latest by `finishDocument`; the document then has no result.
class MARLET_EXPORT MLFXMLCommentContainer {
 public:
  virtual ~MLFXMLCommentContainer() = default;
  virtual void addComment(std::string_view text) = 0;
};

/// An element that is open. Its end is written when the element writer that it was passed to returns or throws.
class MARLET_EXPORT MLFXMLElement : public virtual MLFXMLCommentContainer {
 public:
  /// Without an element writer the element stays empty.
  virtual void addChildElementWithName(const std::string& name, const MLFXMLAttributes& attributes = {},
                                       const MLFXMLElementWriter& elementWriter = {}) = 0;
  virtual void addText(std::string_view text) = 0;
};

/// A document that is open.
class MARLET_EXPORT MLFXMLDocument : public virtual MLFXMLCommentContainer {
 public:
  /// A second root element is a fatal error.
  virtual void createRootElementWithName(const std::string& name, const MLFXMLAttributes& attributes = {},
                                         const MLFXMLElementWriter& elementWriter = {}) = 0;
};
using MLFXMLDocumentWriter = std::function<void(MLFXMLDocument&)>;

/// Writes an XML document through nested callbacks, so that no end tag can be forgotten. One thread at a time.
class MARLET_EXPORT MLFXMLWriter final : public MLFXMLElement, public MLFXMLDocument {
 public:
  /// The document that `documentWriter` writes, in UTF-8 and indented by four blanks a level.
  static Data XMLDataUsingDocumentWriter(const MLFXMLDocumentWriter& documentWriter);
  /// Writes it to a file, as a whole or, when anything throws, not at all. Throws the file error.
  static void writeXMLToURL(const URL& url, const MLFXMLDocumentWriter& documentWriter);
  static void writeXMLToFile(std::string_view path, const MLFXMLDocumentWriter& documentWriter);

  /// To be followed by `startDocument`, one root element, `finishDocument`, and a look at the result. Throws
  /// `std::bad_alloc`.
  MLFXMLWriter();
  ~MLFXMLWriter() override;
  MLFXMLWriter(const MLFXMLWriter&) = delete;
  MLFXMLWriter& operator=(const MLFXMLWriter&) = delete;

  void startDocument();
  void finishDocument();
  Data XMLData() const;
  void writeToURL(const URL& url) const;
  /// Runs `block` while trees that libxml2 writes on this thread are indented by four blanks.
  static void performBlockWithCustomTreeIndentString(const std::function<void()>& block);

  void addComment(std::string_view text) override;
  void addChildElementWithName(const std::string& name, const MLFXMLAttributes& attributes = {},
                               const MLFXMLElementWriter& elementWriter = {}) override;
  void addText(std::string_view text) override;
  void createRootElementWithName(const std::string& name, const MLFXMLAttributes& attributes = {},
                                 const MLFXMLElementWriter& elementWriter = {}) override;

 private:
  class OpenElement;
  static void keepError(void* self, _xmlError* error) noexcept;
  template <class Calls>
  void perform(const Calls& calls) noexcept;
  void requireSuccess() const;

  _xmlDoc* _doc = nullptr;
  _xmlTextWriter* _writer = nullptr;
  bool _didAddRootElement = false;
  unsigned _depth = 0;
  /// Bytes of the texts that follow each other, which become one.
  std::size_t _textSize = 0;
  /// The first error, behind which nothing is written.
  std::exception_ptr _error;
};

}  // namespace MarletFoundation
