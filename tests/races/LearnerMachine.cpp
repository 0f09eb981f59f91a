/// What a learner has survives everything: random edits, saves, updates good and hostile, and writers that are killed.
/// After each step every line, file and value that was reported saved is as it was left, but for what the step says.
///
/// learner_machine STEPS [SEED]

#include <signal.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <functional>
#include <iostream>
#include <map>
#include <random>

#include "MarletDiff/ContentDiff.h"
#include "MarletFoundation/MarletFoundation.h"
#include "MarletFoundation/Platform/Text.h"
#include "support/Documents.h"

namespace fs = std::filesystem;
using namespace MarletFoundation;
using MarletDiff::FileDiffDescriptor;

namespace {

constexpr int Pages = 4, Lines = 4;

/// What a learner has: the lines that they typed, whole files of theirs, their drawings, and what the pages stored.
struct Learner {
  std::map<std::pair<int, int>, std::string> lines;
  std::map<std::string, std::string> files, drawings, values;
  bool operator==(const Learner&) const = default;
};

std::string pageFile(int page) {
  return "Chapters/One/Pages/P" + std::to_string(page) + ".marletpage/Contents.swift";
}

std::string source(int page, const std::string& head, const std::vector<std::string>& lines) {
  std::string text = "// " + std::to_string(page) + " " + head + "\n//#-editable-code\n";
  for (const auto& line : lines) text += line + "\n";
  return text + "//#-end-editable-code\n";
}

std::vector<std::string> linesOf(const std::string& text) {
  std::vector<std::string> lines;
  for (std::size_t start = 0; start < text.size();) {
    const auto end = text.find('\n', start);
    lines.push_back(text.substr(start, end - start));
    start = end == std::string::npos ? text.size() : end + 1;
  }
  return lines;
}

test::Tree firstBook() {
  test::Tree book{
      {"Contents/Manifest.plist", PropertyListDictionary{{"Version", "1.0"},
                                                         {"Name", "Machine"},
                                                         {"ContentIdentifier", "org.example"},
                                                         {"ContentVersion", "1.0"},
                                                         {"DeploymentTarget", "slateos9.0"},
                                                         {"Chapters", PropertyListValue::Array{"One"}}}}};
  PropertyListValue::Array names;
  for (int page = 0; page < Pages; ++page) {
    names.push_back("P" + std::to_string(page) + ".marletpage");
    book = book.with("Contents/" + pageFile(page), source(page, "0", {"a", "b", "c", "d"}))
               .with("Contents/" + fs::path(pageFile(page)).parent_path().string() + "/Manifest.plist",
                     PropertyListDictionary{{"Name", "P"}, {"LiveViewMode", "HiddenByDefault"}});
  }
  return book.with("Contents/Chapters/One/Manifest.plist",
                   PropertyListDictionary{{"Name", "One"}, {"Pages", std::move(names)}});
}

class Machine {
 public:
  Machine(fs::path directory, unsigned seed) : directory_(std::move(directory)), random_(seed) {
    firstBook().writeTo(directory_ / "Book.marletbook");
  }

  void step() {
    static constexpr void (Machine::*steps[])() = {&Machine::type,  &Machine::revert, &Machine::keepFile,
                                                   &Machine::draw,  &Machine::store,  &Machine::update,
                                                   &Machine::attack};
    next_ = learner_;
    work_ = {};
    (this->*steps[below(std::size(steps))])();
    below(4) == 0 ? runKilled() : run();
  }

  /// What of the learner's the book doesn't have, for a message.
  std::string lastStep;

 private:
  unsigned below(std::size_t count) { return static_cast<unsigned>(random_() % count); }
  URL url() const { return URL::file((directory_ / "Book.marletbook").string(), true); }

  void run() {
    try {
      work_();
      require(next_);
      learner_ = next_;
    } catch (const Error& error) {
      lastStep += ", refused: " + std::string(error.description());
      require(learner_);
    }
  }

  /// The step may be done or not, and nothing between.
  void runKilled() {
    lastStep += ", killed";
    const auto child = ::fork();
    if (child == 0) {
      try {
        work_();
      } catch (const Error&) {
      }
      ::_exit(0);
    }
    ::usleep(below(6000));
    ::kill(child, SIGKILL);
    ::waitpid(child, nullptr, 0);
    if (missing(next_).empty()) {
      learner_ = next_;
    } else {
      require(learner_);
    }
  }

  void require(const Learner& learner) {
    if (const auto what = missing(learner); !what.empty()) throw std::runtime_error(lastStep + ": " + what);
  }

  std::string missing(const Learner& learner) const {
    const auto book = openBook(url());
    const auto text = [&](const std::string& path) {
      const auto data = book.userEdits ? mergedUserEdit(*book.userEdits, path) : std::nullopt;
      return data ? std::string(data->view()) : "-";
    };
    for (const auto& [place, line] : learner.lines) {
      const auto lines = linesOf(text(pageFile(place.first)));
      const auto number = static_cast<std::size_t>(place.second) + 2;
      if (number >= lines.size() || lines[number] != line)
        return "lost " + line + " in " + pageFile(place.first);
    }
    for (const auto& [path, contents] : learner.files) {
      if (text(path) != contents) return "lost " + path;
    }
    for (const auto& [name, contents] : learner.drawings) {
      const auto edits = book.document.child("Edits");
      const auto drawings = edits ? edits->child("UserResources") : std::nullopt;
      const auto drawing = drawings ? drawings->child(name) : std::nullopt;
      if (!drawing || drawing->regularFileContents()->view() != contents) return "lost the drawing " + name;
    }
    for (const auto& [key, value] : learner.values) {
      const auto* stored = book.snapshot.keyValueStore.contents().find(key);
      if (!stored || *stored != PropertyListValue(value)) return "lost the value " + key;
    }
    return {};
  }

  std::string fresh(const char* prefix) {
    static constexpr const char* kinds[] = {"", " é", " 書く。", "\f", " //#-hidden", "\t\"", " 😀"};
    return prefix + std::to_string(++count_) + kinds[below(std::size(kinds))];
  }

  static void saveEdits(const URL& url, const UserEdits& edits) {
    const auto book = openBook(url);
    const auto pack = book.userEdits
                          ? *book.userEdits
                          : makeUserEditDiffPack(book.snapshot, url.appendingPathComponent("Contents", true));
    setUserEdits(book.document, checkedFileWrapper(updatedUserEditDiffPack(pack, edits)));
    book.document.write(url);
  }

  std::vector<std::string> editedLines(int page) const {
    const auto book = openBook(url());
    const auto contents = url().appendingPathComponent("Contents", true);
    const auto data = mergedUserEdit(
        book.userEdits ? *book.userEdits : makeUserEditDiffPack(book.snapshot, contents), pageFile(page));
    return linesOf(std::string(data->view()));
  }

  static std::string joined(const std::vector<std::string>& lines) {
    std::string text;
    for (const auto& line : lines) text += line + "\n";
    return text;
  }

  void type() {
    const int page = static_cast<int>(below(Pages)), line = static_cast<int>(below(Lines));
    const auto typed = fresh("typed ");
    auto lines = editedLines(page);
    lines[static_cast<std::size_t>(line) + 2] = typed;
    next_.lines[{page, line}] = typed;
    lastStep = "typing " + typed;
    work_ = [url = url(), page, text = joined(lines)] { saveEdits(url, {{pageFile(page), Data(text)}}); };
  }

  void revert() {
    const int page = static_cast<int>(below(Pages));
    std::erase_if(next_.lines, [&](const auto& line) { return line.first.first == page; });
    lastStep = "reverting page " + std::to_string(page);
    work_ = [url = url(), page] { saveEdits(url, {{pageFile(page), std::nullopt}}); };
  }

  void keepFile() {
    const auto path = "Resources/own-" + std::to_string(below(3));
    next_.files[path] = fresh("file ");
    lastStep = "keeping " + path;
    work_ = [url = url(), path, contents = next_.files[path]] { saveEdits(url, {{path, Data(contents)}}); };
  }

  template <class Change>
  void changeEdits(Change change) {
    work_ = [url = url(), change] {
      const auto book = openBook(url);
      auto edits = book.document.child("Edits");
      if (!edits) {
        edits = FileWrapper::directory();
        edits->setPreferredFilename("Edits");
        FileWrapper(book.document).addFileWrapper(*edits);
      }
      change(*edits);
      book.document.write(url);
    };
  }

  static FileWrapper named(const std::string& name, FileWrapper item) {
    item.setPreferredFilename(name);
    return item;
  }

  void draw() {
    const auto name = "drawing-" + std::to_string(below(3));
    next_.drawings[name] = fresh("drawn ");
    lastStep = "drawing " + name;
    changeEdits([name, contents = next_.drawings[name]](FileWrapper edits) {
      if (!edits.child("UserResources"))
        edits.addFileWrapper(named("UserResources", FileWrapper::directory()));
      edits.child("UserResources")->addFileWrapper(named(name, FileWrapper::regularFile(Data(contents))));
    });
  }

  void store() {
    next_.values["key-" + std::to_string(below(3))] = fresh("value ");
    lastStep = "storing";
    MarletKeyValueStore store;
    PropertyListDictionary contents;
    for (const auto& [key, value] : next_.values) contents[key] = value;
    store.setContents(std::move(contents));
    changeEdits([data = store.snapshot().plistData()](FileWrapper edits) {
      edits.addFileWrapper(named("KeyValueStore.plist", FileWrapper::regularFile(data)));
    });
  }

  void apply(std::vector<FileDiffDescriptor> updates) {
    work_ = [url = url(), source = sourceURL(), updates = std::move(updates)] {
      applyCheckedUpdate(url, DiffPackSnapshot(DiffPackType::UpdatePack, DiffPackDocumentType::MarletBook,
                                               source, "org.example", "1.0", "1.0", updates));
    };
  }

  URL sourceURL() const { return URL::file((directory_ / "update").string(), true); }

  /// Changes the line above the editable ones, or one of them, which may be the learner's by now.
  void update() {
    const int page = static_cast<int>(below(Pages));
    const auto old = std::string(
        FileManager::readFile(url().appendingPathComponent("Contents/" + pageFile(page), false)).view());
    auto lines = linesOf(old);
    const auto line = below(Lines + 1);
    lines[line == Lines ? 0 : line + 2] = fresh("// updated ");
    fs::create_directories(directory_ / "update");
    lastStep = "updating page " + std::to_string(page);
    apply({{FileDiffDescriptor::Modified{
        pageFile(page), MarletDiff::diffContent(*utf16FromUTF8(old), *utf16FromUTF8(joined(lines)),
                                                MarletDiff::DiffOptions::SmallerHunks)}}});
  }

  void attack() {
    const int number = static_cast<int>(below(Pages));
    const auto page = pageFile(number);
    test::Tree{{page, source(number, "theirs", {"e", "f", "g", "h"})},
               {"Chapters/One/Manifest.plist", "garbage"},
               {"Resources/own-0", "theirs"}}
        .writeTo(directory_ / "update");
    const std::vector<FileDiffDescriptor> attacks{
        {FileDiffDescriptor::Removed{"Edits"}},
        {FileDiffDescriptor::Removed{"Edits/UserEdits.diffpack"}},
        {FileDiffDescriptor::Removed{"Edits/UserResources/drawing-0"}},
        {FileDiffDescriptor::Removed{"Contents"}},
        {FileDiffDescriptor::Removed{"Contents/" + page}},
        {FileDiffDescriptor::Replaced{page, {}}},
        {FileDiffDescriptor::Added{"Chapters/One/Manifest.plist", {}}},
        {FileDiffDescriptor::Added{"Resources/own-0", {}}},
        {FileDiffDescriptor::Modified{page, {{{0, 4}, {0, 4}, u"nope", u"gone"}}}}};
    lastStep = "attacking";
    apply({attacks[below(attacks.size())]});
  }

  fs::path directory_;
  std::mt19937 random_;
  Learner learner_, next_;
  std::function<void()> work_;
  int count_ = 0;
};

}  // namespace

int main(int count, char** arguments) {
  const int steps = count > 1 ? std::stoi(arguments[1]) : 1000;
  const auto seed = count > 2 ? static_cast<unsigned>(std::stoul(arguments[2])) : 1u;
  const test::TemporaryDirectory directory;
  Machine machine(directory.path(), seed);
  for (int step = 1; step <= steps; ++step) {
    try {
      machine.step();
    } catch (const std::exception& error) {
      std::cout << "seed " << seed << ", step " << step << ": " << error.what() << std::endl;
      return 1;
    }
  }
  std::cout << steps << " steps" << std::endl;
  return 0;
}
