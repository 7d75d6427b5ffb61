#pragma once

#include <string>
#include <string_view>

struct evp_md_ctx_st;

namespace pelliko::server
{

/// The SHA-256 of bytes that come in pieces.
class Sha256
{
public:
    Sha256();
    ~Sha256();
    Sha256(const Sha256 &) = delete;
    Sha256 &operator=(const Sha256 &) = delete;

    void add(std::string_view bytes);
    /// In hexadecimal; nothing is added afterwards.
    [[nodiscard]] std::string hex();

private:
    evp_md_ctx_st *m_context;
};

} // namespace pelliko::server
