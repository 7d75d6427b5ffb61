// Takes a stream of server-sent events apart
#pragma once

#include <functional>
#include <string>
#include <string_view>

namespace pelliko::service
{

struct ServerEvent {
    std::string id; ///< the last id that the stream gave, empty when it gave none
    std::string type;
    std::string data;
};

/** Puts events together from pieces of any size. Fields it does not know and comments are skipped.
 */
class ServerEvents
{
public:
    explicit ServerEvents(std::function<void(const ServerEvent &)> event);

    /** @return false when a line or an event is longer than any that the server sends; nothing more
     * is taken then */
    bool take(std::string_view piece);

private:
    void line(std::string_view text);
    void field(std::string_view name, std::string_view value);
    void dispatch();

    std::function<void(const ServerEvent &)> event_;
    std::string line_;
    std::string type_;
    std::string data_;
    std::string id_;
    bool hasData_ = false;
    bool afterReturn_ = false;
    bool tooLong_ = false;
};

} // namespace pelliko::service
