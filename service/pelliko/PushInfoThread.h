// Asks the service for received shares on a thread of the library
#pragma once

#include <gio/gio.h>

#include <functional>
#include <string>

namespace pelliko::client
{

/** @param error 0 or a code of pelliko_shares.h @param share borrowed a{sv}, empty with an error */
using ShareAnswer = std::function<void(int error, GVariant *share)>;

/**
 * Asks the service for a received share on the library's own thread, which is made on first use and
 * lives as long as the process. Any thread, also from inside an answer.
 * @param answer called once, on that thread and under no lock
 */
void askOnThread(std::string token, ShareAnswer answer);

} // namespace pelliko::client
