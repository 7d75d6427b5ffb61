// What the server says about when it wants to be asked again
#pragma once

#include "Http.h"

namespace pelliko::service
{

/** How long an answer asks to be left alone, by its Retry-After: milliseconds, at most a day's; 0
 * when it does not. */
int64_t askedRest(const HttpAnswer &answer);

/** The time until which a server is not asked for something, whatever else would be a reason to ask
 * it. */
class ServerRest
{
public:
    /** Milliseconds before that server may be asked, 0 for now. Another server than at the last
     * call has asked for nothing. */
    int64_t left(const std::string &server, int64_t nowMs);
    /** The server of the last call of left() is to be left alone from now on; what it asked for
     * earlier stays when that ends later. */
    void begin(int64_t restMs, int64_t nowMs);

private:
    std::string server_;
    int64_t until_ = 0;
};

} // namespace pelliko::service
