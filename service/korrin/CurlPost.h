// One JSON request to a share server.
#pragma once

#include <atomic>
#include <string>
#include <vector>

namespace pelliko::korrin
{

struct PostAnswer {
    /// Empty when there was an answer, else "unreachable", "timeout", "certificate" or
    /// "unexpected_answer".
    std::string failure;
    long status = 0;
    std::string body;
    long long retryAfterSeconds = 0;
};

/// Waits for the answer. Ends soon after `cancelled` became true. Any thread. SSL_CERT_FILE names
/// the certificates to trust in place of the system's.
PostAnswer postJson(const std::string &url, const std::vector<std::string> &headers,
                    const std::string &body, const std::atomic<bool> &cancelled);

} // namespace pelliko::korrin
