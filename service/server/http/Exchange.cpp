#include "http/Exchange.h"

#include "http/Errors.h"

#include <array>

namespace pelliko::server
{

Task<std::string> readWholeBody(Exchange &exchange, std::size_t limit)
{
    const auto &announced = exchange.request().bodyLength;
    if (announced && *announced > limit)
        throw Refusal(Error::tooLarge);
    std::string body;
    std::array<char, 16384> part;
    while (true) {
        const std::size_t count = co_await exchange.readBody(part);
        if (count == 0)
            co_return body;
        if (body.size() + count > limit)
            throw Refusal(Error::tooLarge);
        body.append(part.data(), count);
    }
}

} // namespace pelliko::server
