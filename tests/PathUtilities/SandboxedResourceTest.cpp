#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <filesystem>
#include <fstream>
#include <map>

#include "MarletFoundation/Data/PropertyListSerializable.h"
#include "MarletFoundation/PathUtilities/ExtendedAttributeAccess.h"
#include "MarletFoundation/PathUtilities/MLFSandboxedResource.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FileManager.h"
#include "MarletFoundation/Platform/HostEnvironment.h"
#include "MarletFoundation/Platform/SecurityScope.h"
#include "support/ChangedHost.h"
#include "support/Failure.h"
#include "support/Tree.h"

namespace MarletFoundation::test {
namespace {

namespace fs = std::filesystem;

class SandboxedResource : public testing::Test {
 protected:
  SandboxedResource() {
    useSupport("support");
    std::ofstream(directory_.path() / "page") << "text";
    fs::create_symlink("page", directory_.path() / "link");
  }

  void useSupport(const char* name) {
    host_.reset();
    host_.emplace([&](HostEnvironment& host) { host.applicationSupportDirectory = directory_.url(name); });
  }
  /// Exit status of another process that opens what the property list holds.
  int openElsewhere(const PropertyListValue& object) const {
    const auto list = directory_.url("list");
    FileManager::writeFileAtomically(list,
                                     PropertyListSerialization::write(object, PropertyListFormat::binary));
    const auto command = "XDG_DATA_HOME='" + (directory_.path() / "support").string() + "' '" +
                         OPEN_SANDBOXED_RESOURCE + "' '" + list.path() + "'";
    return WEXITSTATUS(std::system(command.c_str()));
  }

  std::optional<ChangedHost> host_;
  const TemporaryDirectory directory_;
  const URL page_ = directory_.url("page");
};

TEST_F(SandboxedResource, GivesAccessAsLongAsItLives) {
  const MLFSandboxedResource issued(page_);
  EXPECT_FALSE(issued.accessingSecurityScopedResource);
  EXPECT_EQ(issued.sandboxExtensionToken.view().back(), '\0');
  {
    const MLFSandboxedResource first(issued.propertyListObject()), second(issued.propertyListObject());
    EXPECT_EQ(first.resourceURL, page_);
    EXPECT_TRUE(second.accessingSecurityScopedResource);
    EXPECT_EQ(SecurityScope::accessCount(page_), 2u);
    const auto copy = first.copy();
    EXPECT_EQ(copy->sandboxExtensionToken, issued.sandboxExtensionToken);
    EXPECT_FALSE(copy->accessingSecurityScopedResource);
  }
  EXPECT_EQ(SecurityScope::accessCount(page_), 0u);
  struct stat status;
  ASSERT_EQ(::stat((directory_.path() / "support/MarletFoundation/SandboxSecret").c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777, 0600u);
}

struct Coder : KeyedCoder {
  std::map<std::string, URL, std::less<>> urls;
  std::map<std::string, Data, std::less<>> data;
  void encodeURL(const URL& url, std::string_view key) override { urls.emplace(key, url); }
  void encodeData(const Data& bytes, std::string_view key) override { data.emplace(key, bytes); }
  std::optional<URL> decodeURL(std::string_view key) const override {
    const auto found = urls.find(key);
    return found == urls.end() ? std::nullopt : std::optional(found->second);
  }
  std::optional<Data> decodeData(std::string_view key) const override {
    const auto found = data.find(key);
    return found == data.end() ? std::nullopt : std::optional(found->second);
  }
};

TEST_F(SandboxedResource, KeepsTheTokenThatItsURLBrings) {
  const MLFSandboxedResource resource(SecurityScope::attachSecurityScope(page_, "of another process"));
  EXPECT_EQ(resource.sandboxExtensionToken.view(), std::string_view("of another process", 19));
}

TEST_F(SandboxedResource, TravelsThroughACoder) {
  Coder coder;
  MLFSandboxedResource(page_).encodeWithCoder(coder);
  EXPECT_EQ(MLFSandboxedResource(coder).resourceURL, page_);
  EXPECT_FALSE(MLFSandboxedResource(Coder()).accessingSecurityScopedResource);
  coder.data.clear();
  EXPECT_FALSE(MLFSandboxedResource(coder).accessingSecurityScopedResource);
}

TEST_F(SandboxedResource, OpensInAnotherProcessUnlessForged) {
  std::ofstream(directory_.path() / "other") << "text";
  const auto good = MLFSandboxedResource(page_).propertyListObject();
  EXPECT_EQ(openElsewhere(good), 0);

  const auto with = [&](std::string_view key, PropertyListValue value) {
    auto changed = *good.dictionary();
    changed[key] = std::move(value);
    return PropertyListValue(std::move(changed));
  };
  const auto token = std::string(good.dictionary()->find("sandboxExtensionToken")->data()->view());
  const auto replaced = [&](std::string_view what, std::string_view by) {
    auto changed = token;
    return Data(changed.replace(changed.find(what), what.size(), by));
  };
  const std::pair<const char*, PropertyListValue> refused[] = {
      {"another file", with("resourceURL", directory_.url("other").absoluteString())},
      {"widened path", with("sandboxExtensionToken", replaced("/page", "/"))},
      {"widened access", with("sandboxExtensionToken", replaced(";read;", ";write;"))},
      {"flipped digit", with("sandboxExtensionToken",
                             Data(token.substr(0, 30) + (token[30] == '0' ? "1" : "0") + token.substr(31)))},
      {"no NUL", with("sandboxExtensionToken", Data(token.substr(0, token.size() - 1)))},
      {"no token", with("sandboxExtensionToken", Data())},
      {"no dictionary", "text"},
  };
  for (const auto& [name, object] : refused) {
    EXPECT_EQ(openElsewhere(object), 1) << name;
    const MLFSandboxedResource resource(object);
    EXPECT_FALSE(resource.resourceURL) << name;
    EXPECT_EQ(resource.copy(), nullptr);
  }

  fs::remove(directory_.path() / "page");
  EXPECT_EQ(openElsewhere(good), 1) << "gone";
  fs::create_symlink("other", directory_.path() / "page");
  EXPECT_EQ(openElsewhere(good), 1) << "a link now";
  fs::remove(directory_.path() / "page");
  std::ofstream(directory_.path() / "page") << "text";
  useSupport("of another user");
  EXPECT_FALSE(MLFSandboxedResource(good).resourceURL) << "another secret";
}

TEST_F(SandboxedResource, IsForTheFileThatItWasGivenFor) {
  const auto root = directory_.path();
  for (const char* name : {"one", "two"}) {
    fs::create_directory(root / name);
    std::ofstream(root / name / "f") << name;
  }
  const auto pointTo = [&](const char* name) {
    fs::remove(root / "lnk");
    fs::create_directory_symlink(name, root / "lnk");
  };
  pointTo("one");
  const auto grant = MLFSandboxedResource(directory_.url("lnk/f")).propertyListObject();
  const auto isGood = [&] { return MLFSandboxedResource(grant).resourceURL.has_value(); };
  EXPECT_TRUE(isGood());
  pointTo("two");
  EXPECT_FALSE(isGood()) << "the way leads elsewhere";
  fs::remove(root / "two/f");
  fs::create_hard_link(root / "one/f", root / "two/f");
  EXPECT_FALSE(isGood()) << "the same file elsewhere";
  pointTo("one");
  EXPECT_TRUE(isGood());
  std::ofstream(root / "one/f") << "what it holds may change";
  EXPECT_TRUE(isGood());
  fs::rename(root / "page", root / "one/f");
  EXPECT_FALSE(isGood()) << "another file in its place";

  for (const char* name : {"lnk/.", "lnk/././", "one/../lnk/."})
    EXPECT_EQ(thrown<ErrorObject>([&] { MLFSandboxedResource resource(directory_.url(name)); }).code(), 1)
        << name;
  const auto unclear = thrown<ErrorObject>([&] { MLFSandboxedResource resource(directory_.url("lnk/..")); });
  EXPECT_EQ(unclear.underlyingError()->code(), EINVAL);
  EXPECT_NO_THROW(MLFSandboxedResource(directory_.url("one/.")));
}

TEST_F(SandboxedResource, IsRefusedForLinksAndWhatIsNotThere) {
  const auto failure = [&](const char* name) {
    return thrown<ErrorObject>([&] { MLFSandboxedResource resource(directory_.url(name)); });
  };
  const auto link = failure("link");
  EXPECT_EQ(link.code(), 1);
  EXPECT_EQ(link.localizedDescription(), "Unable to create sandbox extension for symlink");
  EXPECT_EQ(link.localizedFailureReason(),
            "Sandbox extensions cannot be issued for symlinks for security purposes.");
  const auto missing = failure("missing");
  EXPECT_EQ(missing.domain(), MarletFoundationErrorDomain);
  EXPECT_EQ(missing.code(), 0);
  EXPECT_EQ(missing.localizedDescription(), "Unable to determine if file is a symlink");
  EXPECT_EQ(missing.underlyingError()->code(), ENOENT);
  // Of another machine, though a file here has the same path.
  const auto elsewhere = *URL::parse("https://example.org" + page_.path());
  EXPECT_THROW(MLFSandboxedResource{elsewhere}, ErrorObject);
  EXPECT_FALSE(setExtendedAttribute(elsewhere, {"mark"}, "x"));
  fs::create_directories(directory_.path() / "support/MarletFoundation/SandboxSecret");
  const auto noSecret = failure("page");
  EXPECT_EQ(noSecret.domain(), PosixErrorDomain);
  EXPECT_EQ(noSecret.localizedDescription(),
            "Cannot issue a sandbox extension for file \"" + page_.path() + "\": Operation not permitted");
}

TEST_F(SandboxedResource, ExtendedAttributesAreKeptByNameAndFlags) {
  const MLFExtendedAttributeName name{"mark"}, flagged{"mark", MLFExtendedAttributeFlags::noExport};
  EXPECT_FALSE(extendedAttributeExists(page_, name));
  EXPECT_EQ(extendedAttributeValue(page_, name), std::nullopt);
  if (!setExtendedAttribute(page_, name, "schön")) GTEST_SKIP() << "no attributes in this file system";
  EXPECT_EQ(extendedAttributeValue(page_, name), "schön");
  EXPECT_FALSE(extendedAttributeExists(page_, flagged));
  EXPECT_TRUE(setBooleanExtendedAttributeValue(page_, flagged));
  EXPECT_EQ(extendedAttributeValue(page_, flagged), "1");
  EXPECT_TRUE(setExtendedAttribute(page_, name, ""));
  EXPECT_EQ(extendedAttributeValue(page_, name), "");
  setExtendedAttribute(page_, name, "\xFF");
  EXPECT_TRUE(extendedAttributeExists(page_, name));
  EXPECT_EQ(extendedAttributeValue(page_, name), std::nullopt);
  removeExtendedAttribute(page_, name);
  EXPECT_FALSE(extendedAttributeExists(page_, name));
  EXPECT_FALSE(setExtendedAttribute(page_, {""}, "x"));
  EXPECT_FALSE(setExtendedAttribute(page_, {std::string(300, 'x')}, "x"));
}

}  // namespace
}  // namespace MarletFoundation::test
