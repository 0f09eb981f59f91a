#include "support/Documents.h"

namespace MarletFoundation::test {

Tree goodBook() {
  using D = PropertyListDictionary;
  using A = PropertyListValue::Array;
  return {
      {"Contents/Manifest.plist",
       PropertyListValue(D{{"Version", "1.0"},
                           {"Name", "Loops"},
                           {"Description", "All of them"},
                           {"ContentIdentifier", "org.example.loops"},
                           {"ContentVersion", "1.2"},
                           {"DeploymentTarget", "slateos9.0"},
                           {"ImageReference", "cover.png"},
                           {"Chapters", A{"One.marletchapter", "Two.marletchapter"}}})},
      {"Contents/Sources/Shared.swift", std::string("let shared = 1\n")},
      {"Contents/Resources/cover.png", std::string("png")},
      {"Contents/Chapters/One.marletchapter/Manifest.plist",
       PropertyListValue(D{{"Name", "One"},
                           {"Description", "The first"},
                           {"ImageReference", "one.png"},
                           {"Pages", A{"A.marletpage", "B.cutscenepage"}}})},
      {"Contents/Chapters/One.marletchapter/Sources/", std::string()},
      {"Contents/Chapters/One.marletchapter/Resources/", std::string()},
      {"Contents/Chapters/One.marletchapter/Pages/A.marletpage/Manifest.plist",
       PropertyListValue(D{{"Name", "A"}, {"Description", "Page A"}, {"LiveViewMode", "HiddenByDefault"}})},
      {"Contents/Chapters/One.marletchapter/Pages/A.marletpage/Contents.swift", std::string("print(1)\n")},
      {"Contents/Chapters/One.marletchapter/Pages/A.marletpage/ResultInfo.plist",
       PropertyListValue(
           D{{"Version", "1.0"},
             {"AssessmentInformation", D{{"Status", D{{"Status", "Pass"}}}, {"EverPassed", true}}}})},
      {"Contents/Chapters/One.marletchapter/Pages/B.cutscenepage/Manifest.plist",
       PropertyListValue(D{{"Name", "B"}, {"CutsceneReference", "b.html"}})},
      {"Contents/Chapters/One.marletchapter/Pages/B.cutscenepage/Resources/b.html",
       std::string("<html></html>")},
      {"Contents/Chapters/Two.marletchapter/Manifest.plist",
       PropertyListValue(D{{"Name", "Two"}, {"Pages", A{"C.marletpage"}}})},
      {"Contents/Chapters/Two.marletchapter/Pages/C.marletpage/Manifest.plist",
       PropertyListValue(D{{"Name", "C"}, {"LiveViewMode", "VisibleByDefault"}})},
      {"Contents/Chapters/Two.marletchapter/Pages/C.marletpage/Contents.swift", std::string("print(3)\n")},
      {"Edits/KeyValueStore.plist",
       PropertyListValue(D{{"Version", "1.3"}, {"Contents", D{{"speed", 3}, {"seen", A{"A", true}}}}})},
      {"Edits/UserResources/", std::string()},
  };
}

}  // namespace MarletFoundation::test
