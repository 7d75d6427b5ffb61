// Whom the user has chosen.
#pragma once

#include <ContactNames.h>

#include <cstddef>
#include <vector>

namespace pelliko::picker
{

/// People in the order in which they were chosen. One whose number is not in the contacts has the
/// id 0 and is known by the number.
class Choice
{
public:
    /// How many people one request to share can name.
    static constexpr size_t most = 10;

    /// Chooses somebody, or no longer; false when there is no more room.
    bool toggle(const companion::ContactNumber &person);
    bool has(const companion::ContactNumber &person) const;
    const std::vector<companion::ContactNumber> &people() const { return people_; }
    bool isEmpty() const { return people_.empty(); }

private:
    std::vector<companion::ContactNumber> people_;
};

} // namespace pelliko::picker
