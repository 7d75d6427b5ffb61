// The share server's interface for who receives
#pragma once

#include "Account.h"
#include "ErrorTable.h"
#include "Http.h"
#include "ReceivedJournal.h"

namespace pelliko::service
{

/** The share server's interface for who receives: the push stream and the received shares. */
namespace ReceivedApi
{
/** @param lastId the id after which the stream begins, 0 for every push that waits */
HttpRequest pushStream(const Account &account, int64_t lastId);
HttpRequest acknowledge(const Account &account, int64_t upTo);
HttpRequest getShare(const Account &account, const std::string &token);
HttpRequest forgetShare(const Account &account, const std::string &token);
/** @param from the first byte that is wanted */
HttpRequest getFile(const Account &account, const std::string &token, int index, int64_t from);

/** The token of a push event's data, empty when it has none. */
std::string readPush(const std::string &data);

/** Reads what the server says of a share. @return nothing when it is no such answer */
std::optional<ReceivedDetails> readShare(const HttpAnswer &answer);
} // namespace ReceivedApi

/** Whether a text can be a content token: 1 to 24 characters of base64url. */
bool isContentToken(const std::string &text);

} // namespace pelliko::service
