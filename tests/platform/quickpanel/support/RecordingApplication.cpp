#include "RecordingApplication.h"

#include <stdexcept>

#include "ApplicationId.h"

namespace panel_testing
{
namespace
{

constexpr const char *description = R"(<node><interface name="com.velmora.Platform.Application1">
  <method name="Launch">
    <arg type="a{sv}" direction="in"/><arg type="b" direction="in"/>
    <arg type="i" direction="out"/><arg type="a{sv}" direction="out"/>
  </method>
</interface></node>)";

} // namespace

RecordingApplication::RecordingApplication(const char *id)
    : interface_(g_dbus_node_info_new_for_xml(description, nullptr))
{
    static const GDBusInterfaceVTable functions = {onCall, nullptr, nullptr, {}};
    GError *error = nullptr;
    const std::string path = pelliko::platform::applicationObjectPath(id);
    object_ = g_dbus_connection_register_object(connection_.get(), path.c_str(),
                                                interface_->interfaces[0], &functions, this,
                                                nullptr, &error);
    if (object_ == 0)
        throw std::runtime_error(error->message);
    connection_.own(id);
}

// A call that came but was not handled yet is dropped with the object.
RecordingApplication::~RecordingApplication()
{
    g_dbus_connection_unregister_object(connection_.get(), object_);
    g_dbus_node_info_unref(interface_);
}

std::string RecordingApplication::Launch::extra(const char *key) const
{
    const gchar *value = "";
    g_variant_lookup(extras.get(), key, "&s", &value);
    return value;
}

bool RecordingApplication::waitForLaunches(size_t count)
{
    return waitUntil([&] { return launches_.size() >= count; });
}

void RecordingApplication::onCall(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                                  const gchar *, GVariant *parameters, GDBusMethodInvocation *call,
                                  gpointer self)
{
    GVariant *request = nullptr;
    gboolean replyWanted = FALSE;
    g_variant_get(parameters, "(@a{sv}b)", &request, &replyWanted);
    const Variant owned = Variant::adopt(request);
    const gchar *operation = "";
    g_variant_lookup(request, "operation", "&s", &operation);
    Variant extras =
        Variant::adopt(g_variant_lookup_value(request, "extras", G_VARIANT_TYPE_VARDICT));
    if (!extras)
        extras = Variant(g_variant_new("a{sv}", nullptr));
    static_cast<RecordingApplication *>(self)->launches_.push_back(
        {operation, replyWanted != FALSE, extras});
    g_dbus_method_invocation_return_value(call, g_variant_new("(ia{sv})", 0, nullptr));
}

} // namespace panel_testing
