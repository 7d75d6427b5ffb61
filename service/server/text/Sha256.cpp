#include "text/Sha256.h"

#include <openssl/evp.h>

#include <array>
#include <new>

namespace pelliko::server
{

Sha256::Sha256() : m_context(EVP_MD_CTX_new())
{
    if (m_context == nullptr || EVP_DigestInit_ex(m_context, EVP_sha256(), nullptr) != 1) {
        EVP_MD_CTX_free(m_context);
        throw std::bad_alloc();
    }
}

Sha256::~Sha256()
{
    EVP_MD_CTX_free(m_context);
}

void Sha256::add(std::string_view bytes)
{
    EVP_DigestUpdate(m_context, bytes.data(), bytes.size());
}

std::string Sha256::hex()
{
    constexpr std::string_view digits = "0123456789abcdef";
    std::array<unsigned char, EVP_MAX_MD_SIZE> digest{};
    unsigned int size = 0;
    EVP_DigestFinal_ex(m_context, digest.data(), &size);
    std::string text;
    for (unsigned int index = 0; index < size; ++index) {
        text += digits[digest.at(index) >> 4U];
        text += digits[digest.at(index) & 15U];
    }
    return text;
}

} // namespace pelliko::server
