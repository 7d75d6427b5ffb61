#include "moving/Progress.h"

#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <utility>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;

constexpr auto betweenLooks = 200ms;
constexpr auto betweenLines = 10s;
constexpr double mebibyte = 1024.0 * 1024.0;

} // namespace

Progress::Progress(std::string what, std::uint64_t things, std::uint64_t bytes)
    : m_what(std::move(what)), m_allThings(things), m_allBytes(bytes),
      m_inPlace(isatty(STDERR_FILENO) != 0), m_next(Clock::now() + (m_inPlace ? 0s : betweenLines))
{
}

Progress::~Progress()
{
    if (!m_told)
        return;
    tell();
    if (m_inPlace)
        std::fputc('\n', stderr);
}

void Progress::addBytes(std::uint64_t count)
{
    const std::lock_guard lock(m_mutex);
    m_bytes += count;
    if (Clock::now() >= m_next)
        tell();
}

void Progress::addThings(std::uint64_t count)
{
    const std::lock_guard lock(m_mutex);
    m_things += count;
    if (Clock::now() >= m_next)
        tell();
}

void Progress::tell()
{
    const auto share =
        m_allBytes > 0    ? 100.0 * static_cast<double>(m_bytes) / static_cast<double>(m_allBytes)
        : m_allThings > 0 ? 100.0 * static_cast<double>(m_things) / static_cast<double>(m_allThings)
                          : 100.0;
    std::fprintf(stderr, "%spelliko-server: %s: %3.0f %%, %llu of %llu", m_inPlace ? "\r" : "",
                 m_what.c_str(), std::min(share, 100.0), static_cast<unsigned long long>(m_things),
                 static_cast<unsigned long long>(m_allThings));
    if (m_allBytes > 0)
        std::fprintf(stderr, ", %.1f of %.1f MiB", static_cast<double>(m_bytes) / mebibyte,
                     static_cast<double>(m_allBytes) / mebibyte);
    if (!m_inPlace)
        std::fputc('\n', stderr);
    m_told = true;
    m_next = Clock::now() + (m_inPlace ? std::chrono::milliseconds(betweenLooks) : betweenLines);
}

} // namespace pelliko::server
