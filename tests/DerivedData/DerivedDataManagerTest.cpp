#include "MarletFoundation/DerivedData/DerivedDataManager.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/Environment/Target.h"
#include "MarletFoundation/Platform/DispatchQueue.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/Host.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Version/MarletFoundationVersion.h"
#include "support/Fatal.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;

class DerivedData : public testing::Test {
 protected:
  DerivedData() {
    environment_ = HostEnvironment::defaults();
    environment_.applicationSupportDirectory = directory_.url("support");
    environment_.groupContainer = [this](std::string_view name) { return directory_.url(name); };
    HostEnvironment::setCurrent(environment_);
  }
  ~DerivedData() override { HostEnvironment::setCurrent(HostEnvironment::defaults()); }

  URL info() const { return directory_.url("group.CompilerDerivedData/DerivedData/DerivedDataInfo.plist"); }
  void leaveTraces(const DerivedDataManager& manager) {
    for (const auto* url : {&manager.derivedDataURL, &manager.privateDerivedDataURL, &manager.moduleCacheURL,
                            &manager.codeCompletionCacheURL})
      std::ofstream(fs::path(url->path()) / "trace") << "x";
  }
  int traces(const DerivedDataManager& manager) {
    int count = 0;
    for (const auto* url : {&manager.derivedDataURL, &manager.privateDerivedDataURL, &manager.moduleCacheURL,
                            &manager.codeCompletionCacheURL})
      count += fs::exists(fs::path(url->path()) / "trace");
    return count;
  }

  const TemporaryDirectory directory_;
  HostEnvironment environment_;
};

TEST_F(DerivedData, IsWipedWhereAnotherVersionMadeIt) {
  const DerivedDataManager first;
  const auto container = directory_.url("group.CompilerDerivedData");
  EXPECT_EQ(first.moduleCacheURL, container.appendingPathComponent("Library/Caches/ModuleCache", true));
  EXPECT_EQ(first.codeCompletionCacheURL,
            container.appendingPathComponent("Library/Caches/CodeCompletionCache", true));
  EXPECT_EQ(first.privateDerivedDataURL,
            directory_.url("support").appendingPathComponent("PrivateDerivedData", true));
  const auto good = *PropertyListSerialization::read(FileManager::readFile(info())).dictionary();
  EXPECT_EQ(good,
            (PropertyListDictionary{{"MarletFoundationVersion", MarletFoundationVersionString},
                                    {"SDKRoot", Target::targetWithIdentifier("slateos")->SDKRoot.path()}}));

  const auto with = [&](std::string_view key, std::optional<PropertyListValue> value) {
    auto changed = good;
    if (value) changed[key] = *value;
    if (!value) changed.erase(key);
    return PropertyListSerialization::write(changed, PropertyListFormat::xml);
  };
  const std::tuple<const char*, Data, bool> cases[] = {
      {"same", with("Other", 1), false},
      {"no list", Data(std::string("no list")), true},
      {"no dictionary", PropertyListSerialization::write(1, PropertyListFormat::xml), true},
      {"no version", with("MarletFoundationVersion", std::nullopt), true},
      {"version no string", with("MarletFoundationVersion", 1), true},
      {"other version", with("MarletFoundationVersion", std::string(MarletFoundationVersionString) + " "),
       true},
      {"no root", with("SDKRoot", std::nullopt), true},
      {"other root", with("SDKRoot", "/elsewhere"), true},
  };
  for (const auto& [name, contents, isWiped] : cases) {
    leaveTraces(first);
    FileManager::writeFileAtomically(info(), contents);
    const DerivedDataManager manager;
    EXPECT_EQ(traces(manager), isWiped ? 0 : 4) << name;
    EXPECT_EQ(FileManager::readFile(info()) == contents, !isWiped) << name;
    for (const auto* url : {&manager.moduleCacheURL, &manager.privateDerivedDataURL})
      EXPECT_TRUE(FileManager::isDirectory(*url)) << name;
  }
  fs::remove(info().path());
  leaveTraces(first);
  const DerivedDataManager manager;
  EXPECT_EQ(traces(manager), 0);
  EXPECT_TRUE(FileManager::fileExists(info()));
}

TEST_F(DerivedData, TheNextStartClearsWhatAWipeThatEndedTooSoonLeft) {
  const DerivedDataManager first;
  const auto left = [&](const URL& url, const std::string& unique) {
    const auto place = fs::path(url.path()).parent_path() / ("." + url.lastPathComponent() + "-" + unique);
    fs::create_directories(place / "deep");
    return place;
  };
  const auto unique = randomUUIDString();
  const std::vector<fs::path> lefts = {
      left(first.derivedDataURL, unique), left(first.privateDerivedDataURL, unique),
      left(first.moduleCacheURL, unique), left(first.codeCompletionCacheURL, unique)};
  const fs::path others[] = {left(first.moduleCacheURL, "mine"),
                             left(directory_.url("support/Other"), unique)};
  const DerivedDataManager second;
  const auto isThere = [](const fs::path& place) { return fs::exists(place); };
  EXPECT_TRUE(runUntil([&] { return std::none_of(lefts.begin(), lefts.end(), isThere); }, 10));
  EXPECT_TRUE(std::all_of(std::begin(others), std::end(others), isThere));
  EXPECT_TRUE(FileManager::fileExists(info()));
}

TEST_F(DerivedData, DirectoriesOfADocument) {
  const DerivedDataManager manager;
  const auto base = directory_.path() / "group.CompilerDerivedData/DerivedData";
  // Relative URLs are made from these, so they have to say that they are directories.
  const auto url = [&](const char* name) { return URL::file((base / name).string(), true).absoluteString(); };
  EXPECT_EQ(manager.derivedDataDirectoryURLForMarletWithName("Foo", "abc", false).absoluteString(),
            url("Foo-abc"));
  EXPECT_FALSE(fs::exists(base / "Foo-abc"));
  EXPECT_EQ(manager.buildDirectoryURLForMarletWithName("Foo", "abc").absoluteString(), url("Foo-abc/Build"));
  EXPECT_TRUE(fs::is_directory(base / "Foo-abc/Build"));
  EXPECT_EQ(manager.resourcesBundlesDirectoryURLForMarletWithName("Foo", "abc").absoluteString(),
            url("Foo-abc/ResourcesBundles"));
  EXPECT_EQ(manager.buildDirectoryURLForMarletWithName("Foo", "abc", true, false).absoluteString(),
            directory_.url("support/PrivateDerivedData/Foo-abc/Build").absoluteString() + "/");
  EXPECT_EQ(manager.derivedDataDirectoryURLForMarletWithName("../../..", "x", false).absoluteString(),
            url(".._.._..-x"));
  std::ofstream(base / "Bar-x") << "in the way";
  EXPECT_EQ(manager.buildDirectoryURLForMarletWithName("Bar", "x").absoluteString(), url("Bar-x/Build"));
}

TEST_F(DerivedData, WhatStandsInTheWayIsReported) {
  std::string logged;
  environment_.systemLog = [&](std::string_view entry) { logged += entry; };
  HostEnvironment::setCurrent(environment_);
  const auto container = directory_.path() / "group.CompilerDerivedData";
  fs::create_directories(container / "DerivedData/DerivedDataInfo.plist/x");
  fs::create_directory(container / "Library");
  std::ofstream(container / "Library/Caches") << "in the way";
  DerivedDataManager();
  EXPECT_NE(logged.find("Failed to wipe data: "), std::string::npos) << logged;
  EXPECT_FALSE(fs::exists(info().path()));

  environment_.applicationSupportDirectory = directory_.url("group.CompilerDerivedData/Library/Caches/x");
  HostEnvironment::setCurrent(environment_);
  EXPECT_EQ(
      fatalMessage([] { DerivedDataManager manager; }).find("Unable to get the private derived data URL: "),
      0u);
}

TEST_F(DerivedData, WithoutItsPlacesIsFatal) {
  environment_.applicationSupportDirectory = std::nullopt;
  HostEnvironment::setCurrent(environment_);
  EXPECT_EQ(fatalMessage([] { DerivedDataManager manager; }),
            "Unable to get the private derived data URL: " +
                ErrorObject::posix(ENOENT, "application support").description());
  environment_.groupContainer = [](std::string_view) { return std::nullopt; };
  HostEnvironment::setCurrent(environment_);
  EXPECT_EQ(fatalMessage([] { DerivedDataManager manager; }),
            "Unable to get the dervied data container URL; is the calling process a member of the "
            "'group.CompilerDerivedData' app group?");
}

}  // namespace
}  // namespace MarletFoundation::test
