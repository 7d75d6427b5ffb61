// The people who are chosen, one beside the other.
#pragma once

#include <ContactNames.h>

#include <Elementary.h>

#include <functional>
#include <memory>
#include <vector>

namespace pelliko::picker
{

/// A row that scrolls sideways; pressing somebody asks to take him away.
class Chips
{
public:
    using Remove = std::function<void(const companion::ContactNumber &)>;

    /// At the end of the box; takes no room while nobody is chosen.
    Chips(Evas_Object *box, Remove remove);

    void show(const std::vector<companion::ContactNumber> &people);

private:
    struct Chip {
        Chips *chips = nullptr;
        companion::ContactNumber person;
    };

    Evas_Object *addRow();
    static void onPressed(void *chip, Evas_Object *, void *);

    Evas_Object *place_;
    Remove remove_;
    std::vector<std::unique_ptr<Chip>> shown_;
};

} // namespace pelliko::picker
