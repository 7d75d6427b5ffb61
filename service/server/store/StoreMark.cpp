#include "store/StoreMark.h"

#include <array>
#include <stdexcept>

namespace pelliko::server
{
namespace
{

constexpr std::array<std::string_view, 5> names{"leaving", "left", "arriving", "arrived", "here"};

} // namespace

std::string textOf(const StoreMark &mark)
{
    return mark.id + " " + std::string(names.at(static_cast<std::size_t>(mark.state)));
}

std::optional<StoreMark> markOf(std::string_view text)
{
    while (!text.empty() && text.back() == '\n')
        text.remove_suffix(1);
    const auto space = text.find(' ');
    if (space == std::string_view::npos)
        return std::nullopt;
    for (std::size_t index = 0; index < names.size(); ++index) {
        if (text.substr(space + 1) == names.at(index))
            return StoreMark{std::string(text.substr(0, space)),
                             static_cast<StoreMark::State>(index)};
    }
    return std::nullopt;
}

void refuseUnserved(const std::optional<StoreMark> &mark, const char *what)
{
    if (!mark)
        return;
    const std::string whose = std::string("the ") + what;
    if (mark->state == StoreMark::State::left)
        throw std::runtime_error(whose +
                                 " were moved elsewhere by \"pelliko-server migrate\" and are "
                                 "served there");
    if (mark->state == StoreMark::State::arriving || mark->state == StoreMark::State::arrived)
        throw std::runtime_error(whose + " are only half moved to this place: give the command "
                                         "\"pelliko-server migrate\" again, which goes on");
}

} // namespace pelliko::server
