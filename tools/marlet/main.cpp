#include <CLI/CLI.hpp>
#include <csignal>
#include <iostream>
#include <new>
#include <stdexcept>

#include "ApplyCommand.h"
#include "Check.h"
#include "Convert.h"
#include "DigestCommand.h"
#include "EditCommand.h"
#include "Ending.h"
#include "FatalProblem.h"
#include "Guarded.h"
#include "Interruption.h"
#include "LearnerText.h"
#include "MarletFoundation/MarletFoundation.h"
#include "New.h"
#include "OptionTable.h"
#include "Page.h"
#include "Position.h"
#include "PropertyListCommand.h"
#include "Reference.h"
#include "SafeOutput.h"
#include "Show.h"
#include "TagsCommand.h"
#include "Targets.h"
#include "TextCommand.h"
#include "Unzip.h"

using namespace MarletFoundation;

namespace {

/// What the library asks of its host: words for its errors, and a place for what it has to say beside its
/// results.
void setUpLibrary(const Terminal& terminal) {
  registerUserVisibleError<MarletBookSnapshot::SerializationError>();
  registerUserVisibleError<MarletChapterSnapshot::SerializationError>();
  registerUserVisibleError<MarletSnapshot::SerializationError>();
  registerUserVisibleError<AssessmentInformation::SerializationError>();
  registerUserVisibleError<AssessmentStatus::SerializationError>();
  auto environment = HostEnvironment::defaults();
  environment.systemLog = [&terminal](std::string_view line) { terminal.note(line); };
  environment.diagnostics = [&terminal](std::string_view line) {
    if (terminal.verbose) terminal.note(line);
  };
  environment.leftBehind = [&terminal](std::string_view path, const ErrorObject& reason) {
    terminal.complain(leftBehindSentence(path, reason));
  };
  HostEnvironment::setCurrent(std::move(environment));
  setFatalErrorHandler(
      [](std::string_view message, const SourceLocation&) { throw FatalProblem{std::string(message)}; });
}

/// The statuses, for the end of the help.
std::string statusTable() {
  std::string table = "Exit status:";
  for (const auto& [status, words] : exitStatusWords)
    table += "\n  " + std::to_string(static_cast<int>(status)) + "  " + words;
  return table;
}

/// An empty path would be the working directory, which hardly anybody means.
void refuseEmptyPaths(CLI::App& app) {
  for (auto* option : app.get_options()) {
    const auto type = option->get_type_name();
    if (option->get_positional() && (type == "DIR" || type == "FILE"))
      option->check(
          [](const std::string& path) { return path.empty() ? "the path is empty" : std::string(); });
  }
  for (auto* command : app.get_subcommands({})) refuseEmptyPaths(*command);
}

ExitStatus run(int argc, char** argv) {
  CLI::App app("Create, check and ship books of interactive lessons.", "marlet");
  app.require_subcommand(1);
  app.fallthrough();
  app.set_version_flag("--version", "marlet " + std::string(MarletFoundationVersionString));

  Terminal terminal;
  app.add_flag("-q,--quiet", terminal.quiet, "Print results only");
  app.add_flag("-v,--verbose", terminal.verbose, "Print more of what is going on");
  offerChoices<Terminal::Color>(app.add_option("--color", terminal.color, "When to colour"),
                                {{"auto", Terminal::Color::automatic},
                                 {"always", Terminal::Color::always},
                                 {"never", Terminal::Color::never}});

  auto status = ExitStatus::good;
  bool asJSON = false;

  std::vector<std::string> paths;
  auto* checkCommand =
      app.add_subcommand("check", "Open each document in full and report what is wrong with it");
  checkCommand->add_option("PATH", paths, "Documents to check")->required()->type_name("DIR");
  checkCommand->add_flag("--json", asJSON, "Report as JSON");
  checkCommand->callback([&] { status = check(paths, asJSON, terminal); });

  std::string path;
  auto* showCommand =
      app.add_subcommand("show", "Show a document's table of contents, with marks at the passed pages");
  showCommand->add_option("PATH", path, "The document")->required()->type_name("DIR");
  showCommand->add_flag("--json", asJSON, "Show as JSON");
  showCommand->callback([&] { status = show(path, asJSON, terminal); });

  auto* tagsCommand = app.add_subcommand(
      "tags", "Show what the tags of a page's source make of each line, and their mistakes");
  tagsCommand->add_option("FILE", paths, "Sources of pages")->required()->type_name("FILE");
  tagsCommand->add_flag("--json", asJSON, "Show tags, errors, editable ranges and placeholders as JSON");
  tagsCommand->callback([&] { status = showTags(paths, asJSON, terminal); });

  std::string chapter;
  std::string name;
  bool asText = false;
  auto* pageCommand = app.add_subcommand("page", "Show a page as the learner has it before them");
  pageCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  pageCommand->add_option("CHAPTER", chapter, "The chapter's directory name")->required();
  pageCommand->add_option("PAGE", name, "The page's directory name")->required();
  auto* textFlag = pageCommand->add_flag("--text", asText, "Print the source only");
  pageCommand->add_flag("--json", asJSON, "Show as JSON")->excludes(textFlag);
  pageCommand->callback([&] {
    const auto output = asJSON ? PageOutput::json : asText ? PageOutput::text : PageOutput::summary;
    status = showPage(path, chapter, name, output, terminal);
  });

  std::optional<std::string> bookName;
  std::optional<std::string> identifier;
  bool isCutscene = false;
  auto* newCommand = app.add_subcommand("new", "Make a book, or add a page or a chapter to one");
  auto* newPath = newCommand->add_option("BOOK", path, "The book to make, NAME.marletbook")->type_name("DIR");
  newCommand->add_option("--name", bookName, "The book's name; its file's by default")->type_name("NAME");
  newCommand
      ->add_option("--identifier", identifier, "What identifies its content for good; random by default")
      ->type_name("IDENTIFIER");
  auto* newPageCommand = newCommand->add_subcommand("page", "Add a page at the end of a chapter");
  newPageCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  newPageCommand->add_option("CHAPTER", chapter, "The chapter's directory name")->required();
  newPageCommand->add_option("NAME", name, "The page's name")->required();
  newPageCommand->add_flag("--cutscene", isCutscene, "A page that shows an asset, without code");
  auto* newChapterCommand = newCommand->add_subcommand("chapter", "Add a chapter at the end of a book");
  newChapterCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  newChapterCommand->add_option("NAME", name, "The chapter's name")->required();
  newCommand->callback([&] {
    if (newPageCommand->parsed()) {
      status = makePage(path, chapter, name, isCutscene, terminal);
    } else if (newChapterCommand->parsed()) {
      status = makeChapter(path, name, terminal);
    } else if (newPath->count() == 0) {
      throw CLI::RequiredError("BOOK");
    } else {
      status = makeBook(path, bookName, identifier, terminal);
    }
  });

  std::string converted;
  bool force = false;
  auto* convertCommand =
      app.add_subcommand("convert", "Write a classic document in its current form, or make a book of it");
  convertCommand->add_option("DOCUMENT", path, "The classic document, of any version")
      ->required()
      ->type_name("DIR");
  convertCommand->add_option("-o,--output", converted, "What to write: OUT.marlet or OUT.marletbook")
      ->required()
      ->type_name("DIR");
  convertCommand->add_flag("--force", force, "Replace what lies there");
  convertCommand->callback([&] { status = convert(path, converted, force, terminal); });

  auto form = PropertyListOutput::xml;
  std::string output = "-";
  auto* plistCommand = app.add_subcommand("plist", "Print or convert a property list");
  plistCommand->add_option("FILE", path, "The property list, in either form; - is standard input")
      ->required()
      ->type_name("FILE");
  offerChoices<PropertyListOutput>(
      plistCommand->add_option("--to", form, "The form to write; xml by default"),
      {{"xml", PropertyListOutput::xml},
       {"binary", PropertyListOutput::binary},
       {"json", PropertyListOutput::json}});
  plistCommand->add_option("-o,--output", output, "Where to write; - is standard output")->type_name("FILE");
  plistCommand->callback([&] { status = convertPropertyList(path, form, output, terminal); });

  std::string updated;
  BookDiffOptions diffOptions;
  auto* diffCommand = app.add_subcommand(
      "diff", "Show how two text files differ, or make the update pack from one book to the next");
  diffCommand->add_option("OLD", path, "The book or text file as it is")->required()->type_name("FILE");
  diffCommand->add_option("NEW", updated, "Its next patch release, or the changed text")
      ->required()
      ->type_name("FILE");
  diffCommand->add_option("-o,--output", diffOptions.output, "The .diffpack to write")->type_name("DIR");
  diffCommand->add_flag("-p,--patch", diffOptions.withHunks, "Print the hunks, too");
  diffCommand->add_flag("--exit-code", diffOptions.exitCode, "Exit 1 where there is a difference");
  diffCommand->add_flag("--json", diffOptions.asJSON, "Print as JSON");
  diffCommand->callback([&] { status = diff(path, updated, diffOptions, terminal); });

  std::string ours, theirs;
  std::optional<std::string> mergedOutput;
  auto* mergeCommand = app.add_subcommand("merge", "Merge the changes of two text files against a third");
  mergeCommand->add_option("BASE", path, "The text that both were made from")->required()->type_name("FILE");
  mergeCommand->add_option("OURS", ours, "The one text")->required()->type_name("FILE");
  mergeCommand->add_option("THEIRS", theirs, "The other")->required()->type_name("FILE");
  mergeCommand->add_option("-o,--output", mergedOutput, "Where to write the merged text")->type_name("FILE");
  mergeCommand->callback([&] { status = merge(path, ours, theirs, mergedOutput, terminal); });

  std::string pack;
  ApplyOptions applyOptions;
  auto* applyCommand = app.add_subcommand("apply", "Bring an update into a book under its learner's edits");
  applyCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  applyCommand->add_option("PACK", pack, "The update, a .diffpack directory")->required()->type_name("DIR");
  applyCommand->add_flag("--dry-run", applyOptions.isDryRun, "Only say what would be done");
  applyCommand->add_option("--backup", applyOptions.backup, "A directory to copy the book to first")
      ->type_name("DIR");
  applyCommand->add_flag("--force", applyOptions.force, "Apply a pack that isn't meant for this book");
  applyCommand->add_flag("--json", applyOptions.asJSON, "Report as JSON");
  applyCommand->callback([&] { status = apply(path, pack, applyOptions, terminal); });

  EditOptions editOptions;
  auto* editCommand = app.add_subcommand("edit", "Save files as the learner's edits");
  editCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  auto* setOption = editCommand
                        ->add_option("--set", editOptions.settings,
                                     "A path below Contents and the file that holds its edited text")
                        ->type_name("PATH=FILE")
                        ->allow_extra_args(false);
  auto* revertOption = editCommand
                           ->add_option("--revert", editOptions.reverted,
                                        "A path below Contents to take back to its authored text")
                           ->type_name("PATH")
                           ->allow_extra_args(false);
  editCommand
      ->add_flag("--set-aside", editOptions.setAside,
                 "Rename edits that can't be read, so that the book opens")
      ->excludes(setOption)
      ->excludes(revertOption);
  editCommand->add_flag("--json", editOptions.asJSON, "Report as JSON");
  editCommand->callback([&] { status = edit(path, editOptions, terminal); });

  std::string file;
  auto* textCommand = app.add_subcommand("text", "Print a file as the learner sees it");
  textCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  textCommand->add_option("PATH", file, "The file, below Contents")->required();
  textCommand->callback([&] { status = printLearnerText(path, file, terminal); });

  auto* editsCommand = app.add_subcommand("edits", "List the learner's edits");
  editsCommand->add_option("BOOK", path, "The book")->required()->type_name("DIR");
  editsCommand->add_flag("--json", asJSON, "List as JSON");
  editsCommand->callback([&] { status = listEdits(path, asJSON, terminal); });

  std::vector<std::string> utf8Offsets, utf16Offsets, linesAndColumns;
  auto* positionCommand = app.add_subcommand("position", "Show places of a text in all schemes of offsets");
  positionCommand->add_option("FILE", path, "A text in UTF-8")->required()->type_name("FILE");
  const auto addPlaces = [&](const char* flag, std::vector<std::string>& values, const char* type,
                             const char* help, AskedPlace::Scheme scheme) {
    return positionCommand->add_option(flag, values, help)
        ->type_name(type)
        ->allow_extra_args(false)
        ->check([scheme, type](const std::string& value) {
          return isWellFormed({scheme, value}) ? std::string() : value + " is no " + type;
        });
  };
  using Scheme = AskedPlace::Scheme;
  auto* utf8Option = addPlaces("--utf8", utf8Offsets, "N", "An offset in bytes, from 0", Scheme::utf8);
  auto* utf16Option =
      addPlaces("--utf16", utf16Offsets, "N", "An offset in UTF-16 units, from 0", Scheme::utf16);
  auto* atOption = addPlaces("--at", linesAndColumns, "LINE:COLUMN",
                             "A line and a column in UTF-16 units, from 1", Scheme::lineAndColumn);
  positionCommand->add_flag("--json", asJSON, "Show as JSON");
  positionCommand->callback([&] {
    std::vector<AskedPlace> places;
    auto utf8 = utf8Offsets.begin(), utf16 = utf16Offsets.begin(), at = linesAndColumns.begin();
    for (const auto* option : positionCommand->parse_order()) {
      if (option == utf8Option) places.push_back({Scheme::utf8, *utf8++});
      if (option == utf16Option) places.push_back({Scheme::utf16, *utf16++});
      if (option == atOption) places.push_back({Scheme::lineAndColumn, *at++});
    }
    if (places.empty()) throw CLI::RequiredError("--utf8, --utf16 or --at");
    status = showPositions(path, places, asJSON, terminal);
  });

  std::string directory;
  auto* unzipCommand = app.add_subcommand(
      "unzip",
      "Expand a zip archive, whoever made it, into a directory, within limits (see ENVIRONMENT in the manual page)");
  unzipCommand->add_option("ARCHIVE", path, "The archive")->required()->type_name("FILE");
  unzipCommand->add_option("DIR", directory, "The directory, which is made when missing")
      ->required()
      ->type_name("DIR");
  unzipCommand->callback([&] { status = unzip(path, directory, terminal); });

  bool isSHA1 = false;
  auto* digestCommand = app.add_subcommand("digest", "Print MD5 digests of files, as md5sum prints them");
  digestCommand->add_option("FILE", paths, "The files")->required()->type_name("FILE");
  digestCommand->add_flag("--sha1", isSHA1, "SHA-1 digests, as sha1sum prints them");
  digestCommand->callback([&] { status = printDigests(paths, isSHA1, terminal); });

  auto* targetsCommand = app.add_subcommand("targets", "List the platforms that documents can be made for");
  targetsCommand->add_flag("--json", asJSON, "List as JSON");
  targetsCommand->callback([&] { status = listTargets(asJSON, terminal); });

  // For the build, which makes the installed manual page and completions with it.
  auto reference = Reference::manualPage;
  auto* referenceCommand =
      app.add_subcommand("reference", "Print the manual page or a shell's completions")->group("");
  offerChoices<Reference>(referenceCommand->add_option("FORM", reference, "What to print")->required(),
                          {{"man", Reference::manualPage},
                           {"bash", Reference::bash},
                           {"zsh", Reference::zsh},
                           {"fish", Reference::fish}});
  referenceCommand->callback([&] { printReference(app, reference, std::cout); });

  app.footer(statusTable());
  refuseEmptyPaths(app);
  app.parse_complete_callback([&] { setUpLibrary(terminal); });
  try {
    app.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    if (error.get_exit_code() != 0) {
      std::cerr << printable(error.what()) << "\nRun with --help for more information.\n";
      return ExitStatus::wrongUsage;
    }
    app.exit(error, std::cout);
  }
  return status;
}

/// Runs the command to its end, the last of its output included.
ExitStatus runToTheEnd(int argc, char** argv) {
  const Terminal terminal;
  auto status = ExitStatus::negative;
  try {
    status = run(argc, argv);
    requirePrinted();
  } catch (const CommandFailure& failure) {
    status = failing(failure.status, failure.sentence, terminal);
  } catch (const FatalProblem& fatal) {
    status = failing(status, fatal.message, terminal);
  } catch (const std::length_error&) {
    noteOutOfMemory();
  } catch (const std::bad_alloc&) {
    noteOutOfMemory();
  } catch (const std::exception& error) {
    status = failing(status, error.what(), terminal);
  }
  return wasOutOfMemory() ? endingWithoutMemory() : status;
}

}  // namespace

int main(int argc, char** argv) {
  // A file that may not grow any more is an error of the write.
  std::signal(SIGXFSZ, SIG_IGN);
  handleInterruptions();
  watchMemory();
  try {
    const SafeOutput output;
    const auto status = runToTheEnd(argc, argv);
    endIfInterrupted();
    return static_cast<int>(status);
  } catch (const std::bad_alloc&) {
    return static_cast<int>(endingWithoutMemory());
  }
}
