#include "MarletFoundation/Environment/Target.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <iostream>

#include "MarletFoundation/DerivedData/DerivedDataManager.h"
#include "MarletFoundation/Marlet/MarletSnapshot.h"
#include "MarletFoundation/Platform/Host.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

using D = PropertyListDictionary;
using A = PropertyListValue::Array;
const std::string file = "x.target/TargetInfo.plist";

Tree goodTarget() {
  return {{file, PropertyListValue(D{{"TargetIdentifier", "test.x"},
                                     {"SDKRoot", "SDK"},
                                     {"SDKVersion", "1.0"},
                                     {"DeploymentTarget", "1.0"},
                                     {"ToolchainPath", "Tools"},
                                     {"TargetOS", "slateos10.0"},
                                     {"ExecutableSearchPath", A{"usr/bin", "bin"}}})}};
}

}  // namespace

TEST(Target, LoadsWhatItsDirectorySays) {
  const TemporaryDirectory directory;
  goodTarget().writeTo(directory.path());
  const auto url = directory.url("x.target");
  const auto target = Target::loadFrom(url, false);
  ASSERT_TRUE(target);
  EXPECT_EQ(target->SDKRoot.path(), url.path() + "/SDK");
  EXPECT_EQ(target->executableSearchPath.searchPaths()[1].path(), url.path() + "/bin");
  EXPECT_EQ(target->frameworkSearchPath.searchPaths()[0].path(), url.path() + "/Frameworks");
  EXPECT_EQ(target->privateFrameworkSearchPath.searchPaths()[0].path(), url.path() + "/PrivateFrameworks");
  EXPECT_EQ(target->targetTriple("arm64"), "arm64-quorvex-slateos10.0");
  EXPECT_TRUE(target->targetTripleForHostArchitecture().ends_with("-quorvex-slateos10.0"));
  const auto paths = target->librarySearchPath().searchPaths();
  ASSERT_EQ(paths.size(), 4u);
  EXPECT_EQ(paths[0], url.appendingPathComponent("Tools/usr/lib", true));
  const auto& global = *Toolchain::globalToolchain();
  EXPECT_EQ(paths[2], global.librarySearchPath().searchPaths()[0]);
  EXPECT_EQ(global.effectiveLibrarySearchPath(), global.librarySearchPath());
}

TEST(Target, AnyFaultGivesNone) {
  const auto good = goodTarget();
  const Tree bad[] = {
      good.without(file),
      good.with(file, PropertyListValue(A{})),
      good.with(file, std::string("no plist")),
      good.withKey(file, "SDKRoot", "/SDK"),
      good.withKey(file, "SDKRoot", ""),
      good.withKey(file, "ToolchainPath", "/Tools"),
      good.withKey(file, "ToolchainPath", 1),
      good.withKey(file, "ExecutableSearchPath", A{"usr/bin", "/bin"}),
      good.withKey(file, "ExecutableSearchPath", A{1}),
      good.withoutKey(file, "ExecutableSearchPath"),
      good.withoutKey(file, "TargetOS"),
      good.withKey(file, "SDKVersion", 1.0),
      good.withoutKey(file, "DeploymentTarget"),
      good.withoutKey(file, "TargetIdentifier"),
  };
  for (const auto& tree : bad) {
    const TemporaryDirectory directory;
    tree.writeTo(directory.path());
    EXPECT_FALSE(Target::loadFrom(directory.url("x.target"), false)) << tree;
  }
  const TemporaryDirectory directory;
  good.withoutKey(file, "ToolchainPath").writeTo(directory.path());
  const auto target = Target::loadFrom(directory.url("x.target"), false);
  ASSERT_TRUE(target);
  EXPECT_FALSE(target->toolchain);
}

TEST(TargetRegistry, BundledTargetsAreThereAndOthersAreAddedOnce) {
  ASSERT_TRUE(Target::targetWithIdentifier("slateos"));
  ASSERT_TRUE(Target::targetWithIdentifier("desk"));
  EXPECT_FALSE(Target::targetWithIdentifier("slate"));
  const auto desk = libraryResourcesURL()->appendingPathComponent("Targets/desk.target", true);
  EXPECT_EQ(Target::loadFrom(desk, false), Target::targetWithIdentifier("desk"));
  const auto bundled = Target::allTargets();
  EXPECT_LT(std::find(bundled.begin(), bundled.end(), Target::targetWithIdentifier("desk")),
            std::find(bundled.begin(), bundled.end(), Target::targetWithIdentifier("slateos")));

  const TemporaryDirectory directory;
  goodTarget().writeTo(directory.path());
  const auto url = directory.url("x.target");
  const auto target = Target::loadFrom(url, true);
  EXPECT_EQ(Target::loadFrom(url, true), target);
  EXPECT_EQ(Target::loadFrom(URL::file(url.path(), true), true), target);
  EXPECT_EQ(Target::targetWithIdentifier("test.x"), target);
  EXPECT_EQ(Target::allTargets().size(), bundled.size() + 1);
  EXPECT_FALSE(Target::registerTarget(target, URL::file("/elsewhere")));
  EXPECT_EQ(Target::allTargets().size(), bundled.size() + 1);
}

TEST(TargetRegistry, WithoutResourcesNoTargetIsFoundAndThatIsLogged) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");  // what is loaded once must not be loaded yet
  const TemporaryDirectory directory;
  goodTarget().writeTo(directory.path() / "Targets");
  EXPECT_EXIT(
      {
        std::filesystem::current_path(directory.path());
        const ChangedHost changed([](HostEnvironment& host) {
          host.resourcesDirectory.reset();
          host.systemLog = [](std::string_view entry) { std::cerr << entry << std::endl; };
        });
        std::exit(Target::allTargets().empty() && !Target::targetWithIdentifier("test.x") ? 0 : 1);
      },
      testing::ExitedWithCode(0),
      "Failed to load contents of 'Targets': the library's resources were not found");
}

/// It is older than all that it asks, and so goes last.
struct AsksAtExit {
  ~AsksAtExit() {
    const auto target = Target::targetWithIdentifier("desk");
    const auto& manager = DerivedDataManager::sharedDerivedDataManager();
    manager.buildDirectoryURLForMarletWithName("N", std::string(300, 'u'));  // too long: it is logged
    const Tree classic{
        {"contents.wbmarlet",
         "<marlet version='6.0' target-platform='desk' requires-full-environment='true'><pages/></marlet>"}};
    errorOf([&] { MarletSnapshot(classic.wrapper(), URL::file("/N.marlet")); });  // no "Pages": logged, too
    std::cerr << target->librarySearchPath().searchPaths().size() << " paths" << std::endl;
  }
};

TEST(TargetRegistry, AnswersToTheVeryEndOfTheProcess) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  const TemporaryDirectory directory;
  EXPECT_EXIT(
      {
        static AsksAtExit last;
        auto host = HostEnvironment::current();
        host.applicationSupportDirectory = directory.url();
        host.groupContainer = [url = directory.url()](std::string_view) { return url; };
        host.systemLog = [](std::string_view entry) { std::cerr << entry << std::endl; };
        HostEnvironment::setCurrent(host);
        DerivedDataManager::sharedDerivedDataManager().buildDirectoryURLForMarletWithName("N", "u");
        Toolchain::globalToolchain();
        std::exit(0);
      },
      testing::ExitedWithCode(0), "Failed to create DerivedData directory: .*File wrappers: .*2 paths");
}

TEST(SearchPath, FirstHitWinsAndFormIsAnArrayOfPaths) {
  const TemporaryDirectory directory;
  Tree{{"a/only-a", std::string()},
       {"a/both", std::string()},
       {"b/both", std::string()},
       {"b/only-b", std::string()}}
      .writeTo(directory.path());
  const SearchPath path({directory.url("a"), directory.url("b")});
  EXPECT_EQ(path.URLForFileWithRelativePath("both"), directory.url("a").appendingPathComponent("both"));
  EXPECT_EQ(path.URLForFileWithRelativePath("only-b"), directory.url("b").appendingPathComponent("only-b"));
  EXPECT_FALSE(path.URLForFileWithRelativePath("neither"));
  EXPECT_FALSE(SearchPath().URLForFileWithRelativePath("both"));
  for (const auto& written : {path, SearchPath(), SearchPath({URL::file("/a"), URL::file("/", true)}),
                              Target::targetWithIdentifier("desk")->frameworkSearchPath,
                              Toolchain::globalToolchain()->effectiveLibrarySearchPath()})
    EXPECT_EQ(SearchPath(written.propertyListValue()), written);
  using Failure = SearchPath::PropertyListSerializationError;
  EXPECT_THROW(SearchPath(PropertyListValue("x")), Failure);
  EXPECT_THROW(SearchPath(PropertyListValue(A{"/x", 1})), Failure);
}

}  // namespace MarletFoundation::test
