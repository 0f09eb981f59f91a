#include "MarletFoundation/Platform/Digest.h"

#include <openssl/evp.h>

#include "MarletFoundation/Platform/FatalError.h"

namespace MarletFoundation {

struct MD5::Context {
  EVP_MD_CTX* digest = EVP_MD_CTX_new();
  ~Context() { EVP_MD_CTX_free(digest); }
};

MD5::MD5() : context_(std::make_unique<Context>()) {
  if (EVP_DigestInit_ex(context_->digest, EVP_md5(), nullptr) != 1) fatalError("MD5 is not available");
}

MD5::~MD5() = default;

void MD5::update(std::string_view bytes) {
  if (EVP_DigestUpdate(context_->digest, bytes.data(), bytes.size()) != 1)
    fatalError("MD5 was used after its end");
}

std::array<std::uint8_t, 16> MD5::final() {
  std::array<std::uint8_t, 16> digest;
  if (EVP_DigestFinal_ex(context_->digest, digest.data(), nullptr) != 1)
    fatalError("MD5 was used after its end");
  return digest;
}

}  // namespace MarletFoundation
