#include "ServerEvents.h"

#include <utility>

namespace pelliko::service
{
namespace
{
constexpr size_t longest = 65'536; // bytes of a line, and of an event's data
}

ServerEvents::ServerEvents(std::function<void(const ServerEvent &)> event)
    : event_(std::move(event))
{
}

bool ServerEvents::take(std::string_view piece)
{
    for (const char letter : piece) {
        if (tooLong_) {
            break;
        }
        // Lines end with CR, LF or both.
        const bool second = std::exchange(afterReturn_, letter == '\r') && letter == '\n';
        if (second) {
            continue;
        }
        if (letter == '\r' || letter == '\n') {
            line(std::exchange(line_, {}));
        } else if (line_.size() < longest) {
            line_.push_back(letter);
        } else {
            tooLong_ = true;
        }
    }
    return !tooLong_;
}

void ServerEvents::line(std::string_view text)
{
    if (text.empty()) {
        dispatch();
        return;
    }
    const auto colon = text.find(':');
    if (colon == std::string_view::npos) {
        field(text, {});
    } else if (colon > 0) {
        std::string_view value = text.substr(colon + 1);
        value.remove_prefix(!value.empty() && value.front() == ' ' ? 1 : 0);
        field(text.substr(0, colon), value);
    }
}

void ServerEvents::field(std::string_view name, std::string_view value)
{
    if (name == "id" && value.find('\0') == std::string_view::npos) {
        id_ = value;
    } else if (name == "event") {
        type_ = value;
    } else if (name == "data") {
        data_.append(std::exchange(hasData_, true) ? "\n" : "").append(value);
        tooLong_ = tooLong_ || data_.size() > longest;
    }
}

void ServerEvents::dispatch()
{
    const ServerEvent event{id_, std::exchange(type_, {}), std::exchange(data_, {})};
    if (std::exchange(hasData_, false) && !tooLong_) {
        event_(event);
    }
}

} // namespace pelliko::service
