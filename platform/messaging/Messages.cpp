// The C functions that build and take apart message structures.
#include <cstring>
#include <new>

#include "Structure.h"
#include "msg.h"

using pelliko::messaging::Structure;

namespace
{

Structure *structureOf(msg_struct_t handle)
{
    return static_cast<Structure *>(handle);
}

int resultOf(bool accepted)
{
    return accepted ? MSG_SUCCESS : MSG_ERR_INVALID_PARAMETER;
}

int lend(Structure *part, msg_struct_t *out)
{
    if (!part)
        return MSG_ERR_INVALID_PARAMETER;
    *out = part;
    return MSG_SUCCESS;
}

// No exception may reach a C caller; what can be thrown here is a lack of memory.
template <typename Call> int guarded(const Call &call)
{
    try {
        return call();
    } catch (const std::bad_alloc &) {
        return MSG_ERR_UNKNOWN;
    }
}

} // namespace

extern "C" {

msg_struct_t msg_create_struct(int struct_type)
{
    try {
        return Structure::create(struct_type).release();
    } catch (const std::bad_alloc &) {
        return nullptr;
    }
}

int msg_release_struct(msg_struct_t *msg_struct)
{
    if (!msg_struct || !*msg_struct)
        return MSG_ERR_NULL_POINTER;
    if (!structureOf(*msg_struct)->isOwned())
        return MSG_ERR_INVALID_PARAMETER;
    delete structureOf(*msg_struct);
    *msg_struct = nullptr;
    return MSG_SUCCESS;
}

int msg_set_int_value(msg_struct_t msg_struct, int field, int value)
{
    if (!msg_struct)
        return MSG_ERR_NULL_POINTER;
    return guarded([&] { return resultOf(structureOf(msg_struct)->setInt(field, value)); });
}

int msg_set_str_value(msg_struct_t msg_struct, int field, char *value, int size)
{
    if (!msg_struct || !value)
        return MSG_ERR_NULL_POINTER;
    if (size < 0)
        return MSG_ERR_INVALID_PARAMETER;
    return guarded([&] {
        const std::string text(value, strnlen(value, static_cast<size_t>(size)));
        return resultOf(structureOf(msg_struct)->setText(field, text));
    });
}

int msg_set_bool_value(msg_struct_t msg_struct, int field, bool value)
{
    if (!msg_struct)
        return MSG_ERR_NULL_POINTER;
    return guarded([&] { return resultOf(structureOf(msg_struct)->setBool(field, value)); });
}

int msg_get_struct_handle(msg_struct_t msg_struct, int field, msg_struct_t *value)
{
    if (!msg_struct || !value)
        return MSG_ERR_NULL_POINTER;
    return guarded([&] { return lend(structureOf(msg_struct)->part(field), value); });
}

int msg_set_struct_handle(msg_struct_t msg_struct, int field, msg_struct_t value)
{
    if (!msg_struct || !value)
        return MSG_ERR_NULL_POINTER;
    return guarded(
        [&] { return resultOf(structureOf(msg_struct)->setPart(field, *structureOf(value))); });
}

int msg_list_add_item(msg_struct_t msg_struct, int field, msg_struct_t *item)
{
    if (!msg_struct || !item)
        return MSG_ERR_NULL_POINTER;
    return guarded([&] { return lend(structureOf(msg_struct)->addItem(field), item); });
}
}
