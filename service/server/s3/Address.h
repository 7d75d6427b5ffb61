#pragma once

#include "s3/Signature.h"

#include <string>

namespace pelliko::server::s3
{

/// Where a store is and how it is spoken to.
struct Address {
    bool tls = true;
    /// Host and, unless it is the scheme's own, port; an IPv6 address in brackets.
    std::string host;
    std::string bucket;
    /// In front of every object's name; empty, or with a slash at its end.
    std::string prefix;
    /// The bucket is the first label of the host's name rather than of the path.
    bool virtualHost = false;
    std::string region = "us-east-1";
    /// Certificates of those who vouch for the store; empty for the system's.
    std::string caFile;
    /// A file with the credentials; empty for the environment's.
    std::string credentialsFile;
    /// Whole files go to their readers straight from the store.
    bool redirect = false;
};

/// Reads "s3://HOST[:PORT]/BUCKET[/PREFIX]?style=path|virtual&region=NAME&tls=on|off&ca=FILE&
/// credentials=FILE&redirect=on|off". Throws std::invalid_argument with a sentence.
[[nodiscard]] Address parseAddress(const std::string &url);

/// The credentials in the address's file, or else in AWS_ACCESS_KEY_ID, AWS_SECRET_ACCESS_KEY and
/// AWS_SESSION_TOKEN. Throws std::runtime_error with a sentence that does not quote any.
[[nodiscard]] Credentials readCredentials(const Address &address);

} // namespace pelliko::server::s3
