#pragma once

#include <pelliko_client.h>
#include <string>

namespace pelliko
{

/// What the upload library tells of one received share. What it does not tell is 0, and the sender
/// "default". Each answer is logged.
struct PushInfo {
    unsigned int count = 0;              ///< files
    unsigned long long size = 0;         ///< bytes of all files
    unsigned long long expired_time = 0; ///< as the library gives it
    std::string number;                  ///< of the sender
    char *name = nullptr;                ///< of the sender's contact, owned; null: nobody's

    /// Reads everything, also the contact: the thread is connected to the contacts store.
    explicit PushInfo(pelliko_push_info_h info);
    ~PushInfo();
    PushInfo(const PushInfo &) = delete;
    PushInfo &operator=(const PushInfo &) = delete;

    const char *nameOrNumber() const { return name ? name : number.c_str(); }
};

/// The share as one text: count, size, expiry, number, name ("(null)" without a contact) and token,
/// separated by "|"; at most 1023 bytes.
std::string pushRecord(const PushInfo &info, const char *token);

} // namespace pelliko
