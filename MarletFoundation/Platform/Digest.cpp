#include "MarletFoundation/Platform/Digest.h"

#include <openssl/evp.h>

#include <new>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t SHA1SliceSize = 16384;

/// OpenSSL's running digest of one kind.
class RunningDigest {
 public:
  explicit RunningDigest(const EVP_MD* kind) : context_(EVP_MD_CTX_new()) {
    if (!context_) throw std::bad_alloc();
    if (EVP_DigestInit_ex(context_, kind, nullptr) != 1) fatalError("A digest is not available");
  }
  ~RunningDigest() { EVP_MD_CTX_free(context_); }
  RunningDigest(const RunningDigest&) = delete;
  RunningDigest& operator=(const RunningDigest&) = delete;

  void update(std::string_view bytes) {
    if (EVP_DigestUpdate(context_, bytes.data(), bytes.size()) != 1) usedAfterEnd();
  }
  template <std::size_t size>
  std::array<std::uint8_t, size> final() {
    std::array<std::uint8_t, size> digest;
    if (EVP_DigestFinal_ex(context_, digest.data(), nullptr) != 1) usedAfterEnd();
    return digest;
  }

 private:
  [[noreturn]] static void usedAfterEnd() { fatalError("A digest was used after its end"); }

  EVP_MD_CTX* context_;
};

}  // namespace

struct MD5::Context {
  RunningDigest digest{EVP_md5()};
};

MD5::MD5() : context_(std::make_unique<Context>()) {}
MD5::~MD5() = default;
void MD5::update(std::string_view bytes) { context_->digest.update(bytes); }
std::array<std::uint8_t, 16> MD5::final() { return context_->digest.final<16>(); }

struct SHA1::Context {
  RunningDigest digest{EVP_sha1()};
};

SHA1::SHA1() : context_(std::make_unique<Context>()) {}
SHA1::~SHA1() = default;
void SHA1::update(std::string_view bytes) { context_->digest.update(bytes); }
std::array<std::uint8_t, 20> SHA1::final() { return context_->digest.final<20>(); }

std::string hexadecimal(std::span<const std::uint8_t> bytes) {
  std::string text;
  text.reserve(bytes.size() * 2);
  for (const auto byte : bytes) {
    text += "0123456789abcdef"[byte >> 4];
    text += "0123456789abcdef"[byte & 15];
  }
  return text;
}

Data Data::mlf_SHA1Digest() const {
  SHA1 digest;
  digest.update(view());
  const auto bytes = digest.final();
  return Data(std::vector<std::uint8_t>(bytes.begin(), bytes.end()));
}

std::optional<Data> Data::mlf_SHA1DigestForURL(const URL& url) try {
  const auto contents = FileManager::mapFile(url);
  SHA1 digest;
  updateInSlices(digest, contents.view(), SHA1SliceSize);
  const auto bytes = digest.final();
  return Data(std::vector<std::uint8_t>(bytes.begin(), bytes.end()));
} catch (const ErrorObject&) {
  return std::nullopt;
}

}  // namespace MarletFoundation
