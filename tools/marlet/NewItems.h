#pragma once

#include <string>

#include "MarletFoundation/Data/PropertyListValue.h"
#include "MarletFoundation/Platform/FileWrapper.h"

/// What `marlet new` writes: trees in memory. Book and chapter manifests are XML, so that an update of the
/// book can carry them as text.
MarletFoundation::FileWrapper newBook(const std::string& filename, const std::string& name,
                                      const std::string& identifier);
MarletFoundation::FileWrapper newChapter(const std::string& filename, const std::string& name);
MarletFoundation::FileWrapper newCodePage(const std::string& filename, const std::string& name);
MarletFoundation::FileWrapper newCutscenePage(const std::string& filename, const std::string& name);

MarletFoundation::FileWrapper xmlFile(const MarletFoundation::PropertyListValue& value);

/// Puts `item` into `directory` and at the end of the array at `key` in the manifest of `parent`. The
/// manifest's other keys stay.
void addListed(MarletFoundation::FileWrapper& parent, const std::string& key,
               MarletFoundation::FileWrapper& directory, MarletFoundation::FileWrapper item);
