#include "Structure.h"

#include <algorithm>
#include <array>

#include "msg.h"

namespace pelliko::messaging
{
namespace
{

struct Field {
    int structure;
    int number;
    Kind kind;
    int content; // the structure type of a part or of a list's items
};

constexpr std::array<Field, 11> fields{{
    {MSG_STRUCT_MESSAGE_INFO, MSG_MESSAGE_TYPE_INT, Kind::Int, 0},
    {MSG_STRUCT_MESSAGE_INFO, MSG_MESSAGE_ENCODE_TYPE_INT, Kind::Int, 0},
    {MSG_STRUCT_MESSAGE_INFO, MSG_MESSAGE_SMS_DATA_STR, Kind::Text, 0},
    {MSG_STRUCT_MESSAGE_INFO, MSG_MESSAGE_ADDR_LIST_STRUCT, Kind::List, MSG_STRUCT_ADDRESS_INFO},
    {MSG_STRUCT_MESSAGE_INFO, MSG_MESSAGE_SIM_INDEX_INT, Kind::Int, 0},
    {MSG_STRUCT_ADDRESS_INFO, MSG_ADDRESS_INFO_ADDRESS_TYPE_INT, Kind::Int, 0},
    {MSG_STRUCT_ADDRESS_INFO, MSG_ADDRESS_INFO_RECIPIENT_TYPE_INT, Kind::Int, 0},
    {MSG_STRUCT_ADDRESS_INFO, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, Kind::Text, 0},
    {MSG_STRUCT_SENDOPT, MSG_SEND_OPT_SETTING_BOOL, Kind::Bool, 0},
    {MSG_STRUCT_REQUEST_INFO, MSG_REQUEST_MESSAGE_HND, Kind::Part, MSG_STRUCT_MESSAGE_INFO},
    {MSG_STRUCT_REQUEST_INFO, MSG_REQUEST_SENDOPT_HND, Kind::Part, MSG_STRUCT_SENDOPT},
}};

const Field *findField(int structure, int number, Kind kind)
{
    const auto found = std::find_if(fields.begin(), fields.end(), [&](const Field &field) {
        return field.structure == structure && field.number == number && field.kind == kind;
    });
    return found == fields.end() ? nullptr : &*found;
}

bool isStructure(int type)
{
    return std::any_of(fields.begin(), fields.end(),
                       [type](const Field &field) { return field.structure == type; });
}

} // namespace

std::unique_ptr<Structure> Structure::create(int type)
{
    if (!isStructure(type))
        return nullptr;
    return std::unique_ptr<Structure>(new Structure(type, true));
}

bool Structure::setInt(int field, int value)
{
    if (!findField(type_, field, Kind::Int))
        return false;
    values_[field] = value;
    return true;
}

bool Structure::setBool(int field, bool value)
{
    if (!findField(type_, field, Kind::Bool))
        return false;
    values_[field] = value;
    return true;
}

bool Structure::setText(int field, std::string value)
{
    if (!findField(type_, field, Kind::Text))
        return false;
    values_[field] = std::move(value);
    return true;
}

bool Structure::setPart(int field, const Structure &value)
{
    const Field *known = findField(type_, field, Kind::Part);
    if (!known || known->content != value.type_)
        return false;
    values_[field] = value.copyAsPart();
    return true;
}

Structure *Structure::part(int field)
{
    const Field *known = findField(type_, field, Kind::Part);
    if (!known)
        return nullptr;
    auto &slot = values_[field];
    if (!std::holds_alternative<std::unique_ptr<Structure>>(slot))
        slot = std::unique_ptr<Structure>(new Structure(known->content, false));
    return std::get<std::unique_ptr<Structure>>(slot).get();
}

Structure *Structure::addItem(int field)
{
    const Field *known = findField(type_, field, Kind::List);
    if (!known)
        return nullptr;
    auto &slot = values_[field];
    if (!std::holds_alternative<Items>(slot))
        slot = Items();
    auto &items = std::get<Items>(slot);
    items.push_back(std::unique_ptr<Structure>(new Structure(known->content, false)));
    return items.back().get();
}

const int *Structure::intValue(int field) const
{
    const auto found = values_.find(field);
    return found == values_.end() ? nullptr : std::get_if<int>(&found->second);
}

const std::string *Structure::text(int field) const
{
    const auto found = values_.find(field);
    return found == values_.end() ? nullptr : std::get_if<std::string>(&found->second);
}

const Structure *Structure::partIfSet(int field) const
{
    const auto found = values_.find(field);
    if (found == values_.end())
        return nullptr;
    const auto *part = std::get_if<std::unique_ptr<Structure>>(&found->second);
    return part ? part->get() : nullptr;
}

std::vector<const Structure *> Structure::items(int field) const
{
    std::vector<const Structure *> result;
    const auto found = values_.find(field);
    if (found == values_.end() || !std::holds_alternative<Items>(found->second))
        return result;
    for (const auto &item : std::get<Items>(found->second))
        result.push_back(item.get());
    return result;
}

std::unique_ptr<Structure> Structure::copyAsPart() const
{
    std::unique_ptr<Structure> copy(new Structure(type_, false));
    for (const auto &[field, value] : values_) {
        if (const auto *part = std::get_if<std::unique_ptr<Structure>>(&value)) {
            copy->values_[field] = (*part)->copyAsPart();
        } else if (const auto *items = std::get_if<Items>(&value)) {
            Items copies;
            for (const auto &item : *items)
                copies.push_back(item->copyAsPart());
            copy->values_[field] = std::move(copies);
        } else if (const auto *text = std::get_if<std::string>(&value)) {
            copy->values_[field] = *text;
        } else if (const auto *flag = std::get_if<bool>(&value)) {
            copy->values_[field] = *flag;
        } else {
            copy->values_[field] = std::get<int>(value);
        }
    }
    return copy;
}

} // namespace pelliko::messaging
