#include "MarletFoundation/Platform/Digest.h"

#define OPENSSL_SUPPRESS_DEPRECATED
#include <openssl/md5.h>
#include <openssl/sha.h>

#include "MarletFoundation/Platform/Data.h"
#include "MarletFoundation/Platform/ErrorObject.h"
#include "MarletFoundation/Platform/FatalError.h"
#include "MarletFoundation/Platform/FileManager.h"

namespace MarletFoundation {
namespace {

constexpr std::size_t SHA1SliceSize = 16384;

/// OpenSSL's running digest of one kind, in the form that takes no memory and so can't fail: the one that chooses among
/// providers crashes where memory runs out while it starts.
template <class State, auto start, auto add, auto end, std::size_t size>
class RunningDigest {
 public:
  RunningDigest() { start(&state_); }
  void update(std::string_view bytes) {
    requireUnended();
    add(&state_, bytes.data(), bytes.size());
  }
  std::array<std::uint8_t, size> final() {
    requireUnended();
    hasEnded_ = true;
    std::array<std::uint8_t, size> digest;
    end(digest.data(), &state_);
    return digest;
  }

 private:
  void requireUnended() const {
    if (hasEnded_) fatalError("A digest was used after its end");
  }

  State state_;
  bool hasEnded_ = false;
};

}  // namespace

struct MD5::Context : RunningDigest<MD5_CTX, MD5_Init, MD5_Update, MD5_Final, MD5_DIGEST_LENGTH> {};

MD5::MD5() : context_(std::make_unique<Context>()) {}
MD5::~MD5() = default;
void MD5::update(std::string_view bytes) { context_->update(bytes); }
std::array<std::uint8_t, 16> MD5::final() { return context_->final(); }

struct SHA1::Context : RunningDigest<SHA_CTX, SHA1_Init, SHA1_Update, SHA1_Final, SHA_DIGEST_LENGTH> {};

SHA1::SHA1() : context_(std::make_unique<Context>()) {}
SHA1::~SHA1() = default;
void SHA1::update(std::string_view bytes) { context_->update(bytes); }
std::array<std::uint8_t, 20> SHA1::final() { return context_->final(); }

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
