#include "Choice.h"

#include <algorithm>

namespace pelliko::picker
{

using companion::ContactNumber;

namespace
{

bool areSame(const ContactNumber &one, const ContactNumber &other)
{
    return one.id == other.id && (one.id != 0 || one.number == other.number);
}

} // namespace

bool Choice::toggle(const ContactNumber &person)
{
    const auto found = std::find_if(people_.begin(), people_.end(),
                                    [&](const ContactNumber &one) { return areSame(one, person); });
    if (found != people_.end())
        people_.erase(found);
    else if (people_.size() < most)
        people_.push_back(person);
    else
        return false;
    return true;
}

bool Choice::has(const ContactNumber &person) const
{
    return std::any_of(people_.begin(), people_.end(),
                       [&](const ContactNumber &one) { return areSame(one, person); });
}

} // namespace pelliko::picker
