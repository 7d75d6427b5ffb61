#include "vconf.h"

#include "KeyNode.h"
#include "KeyWatch.h"
#include "Readiness.h"
#include "SessionLanguage.h"

#include <cstring>

using pelliko::vconf::followReadiness;
using pelliko::vconf::followsModems;
using pelliko::vconf::KeyWatch;
using pelliko::vconf::namesLanguage;
using pelliko::vconf::readKey;
using pelliko::vconf::refreshReadiness;
using pelliko::vconf::sessionLanguage;
using pelliko::vconf::Value;
using pelliko::vconf::writeKey;

namespace
{

constexpr int kSuccess = 0;
constexpr int kError = -1;

KeyWatch &keyWatch()
{
    // Never destroyed: callbacks may be removed while the process is ending.
    static auto *watch = new KeyWatch;
    return *watch;
}

int set(const char *key, const Value &value)
{
    return key && writeKey(key, value) ? kSuccess : kError;
}

template <typename Type> int get(const char *key, int *out)
{
    if (!key || !out)
        return kError;
    const std::optional<Value> value = readKey(key);
    const Type *held = value ? std::get_if<Type>(&*value) : nullptr;
    if (!held)
        return kError;
    *out = static_cast<int>(*held);
    return kSuccess;
}

template <typename Type> Type *valueOf(keynode_t *node)
{
    return node ? std::get_if<Type>(&node->value) : nullptr;
}

} // namespace

int vconf_get_bool(const char *in_key, int *boolval)
{
    if (in_key && followsModems(in_key))
        refreshReadiness();
    return get<bool>(in_key, boolval);
}

int vconf_set_bool(const char *in_key, const int boolval)
{
    return set(in_key, Value(boolval != 0));
}

int vconf_get_int(const char *in_key, int *intval)
{
    return get<int>(in_key, intval);
}

int vconf_set_int(const char *in_key, const int intval)
{
    return set(in_key, Value(intval));
}

char *vconf_get_str(const char *in_key)
{
    if (!in_key)
        return nullptr;
    std::optional<Value> value = readKey(in_key);
    if (!value && namesLanguage(in_key))
        value = sessionLanguage();
    const auto *text = value ? std::get_if<std::string>(&*value) : nullptr;
    return text ? strdup(text->c_str()) : nullptr;
}

int vconf_set_str(const char *in_key, const char *strval)
{
    return strval ? set(in_key, Value(std::string(strval))) : kError;
}

int vconf_notify_key_changed(const char *in_key, vconf_callback_fn cb, void *user_data)
{
    if (!in_key || !cb || !keyWatch().add(in_key, cb, user_data))
        return kError;
    if (followsModems(in_key))
        followReadiness();
    return kSuccess;
}

int vconf_ignore_key_changed(const char *in_key, vconf_callback_fn cb)
{
    return in_key && cb && keyWatch().remove(in_key, cb) ? kSuccess : kError;
}

int vconf_keynode_get_bool(keynode_t *keynode)
{
    const bool *value = valueOf<bool>(keynode);
    return value ? static_cast<int>(*value) : kError;
}

int vconf_keynode_get_int(keynode_t *keynode)
{
    const int *value = valueOf<int>(keynode);
    return value ? *value : kError;
}

char *vconf_keynode_get_str(keynode_t *keynode)
{
    auto *value = valueOf<std::string>(keynode);
    return value ? value->data() : nullptr;
}

char *vconf_keynode_get_name(keynode_t *keynode)
{
    return keynode ? keynode->name.data() : nullptr;
}
