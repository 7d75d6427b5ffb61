#include "BusObject.h"

#include <stdexcept>

#include "Panel.h"
#include "com.velmora.Platform.Panel1.h"
#include "notification.h"

namespace pelliko::quickpanel
{
namespace
{

Panel *panelOf(gpointer data)
{
    return static_cast<std::unique_ptr<Panel> *>(data)->get();
}

// A change that the disk refused is answered as an error of the store.
template <typename Call> int attempt(const Call &call)
{
    try {
        return call();
    } catch (const std::exception &error) {
        g_printerr("quickpanel: the store refused a change: %s\n", error.what());
        return NOTIFICATION_ERROR_FROM_DB;
    }
}

GVariant *arrayOf(const std::vector<Variant> &items)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE("aa{sv}"));
    for (const auto &item : items)
        g_variant_builder_add_value(&builder, item.get());
    return g_variant_builder_end(&builder);
}

gboolean onPost(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app, gint64 previous,
                GVariant *content, gpointer data)
{
    int64_t id = 0;
    const int result = attempt(
        [&] { return panelOf(data)->post(app, previous, notification::recordFrom(content), &id); });
    panel_panel1_complete_post(object, call, result, id);
    return TRUE;
}

gboolean onUpdate(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app, gint64 id,
                  GVariant *content, gpointer data)
{
    panel_panel1_complete_update(
        object, call,
        attempt([&] { return panelOf(data)->update(app, id, notification::recordFrom(content)); }));
    return TRUE;
}

gboolean onDelete(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app, gint64 id,
                  gpointer data)
{
    panel_panel1_complete_delete(object, call,
                                 attempt([&] { return panelOf(data)->remove(app, id); }));
    return TRUE;
}

gboolean onDeleteAll(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app, gint type,
                     gpointer data)
{
    panel_panel1_complete_delete_all(object, call,
                                     attempt([&] { return panelOf(data)->removeAll(app, type); }));
    return TRUE;
}

gboolean onLoadByTag(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app,
                     const gchar *tag, gpointer data)
{
    Record record;
    const int result = attempt([&] { return panelOf(data)->load(app, tag, &record); });
    panel_panel1_complete_load_by_tag(object, call, result, notification::toVariant(record).get());
    return TRUE;
}

gboolean onToast(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app,
                 const gchar *message, gpointer data)
{
    panel_panel1_complete_toast(object, call,
                                attempt([&] { return panelOf(data)->toast(app, message); }));
    return TRUE;
}

gboolean onList(PanelPanel1 *object, GDBusMethodInvocation *call, const gchar *app, gpointer data)
{
    std::vector<Variant> items;
    attempt([&] {
        for (const Record &record : panelOf(data)->list(app))
            items.push_back(notification::toVariant(record));
        return 0;
    });
    panel_panel1_complete_list(object, call, arrayOf(items));
    return TRUE;
}

gboolean onTap(PanelPanel1 *object, GDBusMethodInvocation *call, gint64 id, gpointer data)
{
    panel_panel1_complete_tap(object, call, attempt([&] { return panelOf(data)->tap(id); }));
    return TRUE;
}

gboolean onSwipe(PanelPanel1 *object, GDBusMethodInvocation *call, gint64 id, gpointer data)
{
    panel_panel1_complete_swipe(object, call, attempt([&] { return panelOf(data)->swipe(id); }));
    return TRUE;
}

gboolean onHistory(PanelPanel1 *object, GDBusMethodInvocation *call, gpointer data)
{
    std::vector<Variant> events;
    attempt([&] {
        events = panelOf(data)->history();
        return 0;
    });
    panel_panel1_complete_history(object, call, arrayOf(events));
    return TRUE;
}

struct Handler {
    const char *signal;
    GCallback function;
};

const Handler handlers[] = {
    {"handle-post", G_CALLBACK(onPost)},
    {"handle-update", G_CALLBACK(onUpdate)},
    {"handle-delete", G_CALLBACK(onDelete)},
    {"handle-delete-all", G_CALLBACK(onDeleteAll)},
    {"handle-load-by-tag", G_CALLBACK(onLoadByTag)},
    {"handle-toast", G_CALLBACK(onToast)},
    {"handle-list", G_CALLBACK(onList)},
    {"handle-tap", G_CALLBACK(onTap)},
    {"handle-swipe", G_CALLBACK(onSwipe)},
    {"handle-history", G_CALLBACK(onHistory)},
};

} // namespace

struct BusObject::Impl {
    explicit Impl(GDBusConnection *connection)
        : bus(connection), skeleton(panel_panel1_skeleton_new())
    {
        for (const auto &handler : handlers)
            g_signal_connect(skeleton, handler.signal, handler.function, &panel);
    }
    ~Impl()
    {
        g_dbus_interface_skeleton_unexport(G_DBUS_INTERFACE_SKELETON(skeleton));
        g_object_unref(skeleton);
    }
    Impl(const Impl &) = delete;
    Impl &operator=(const Impl &) = delete;

    GDBusConnection *bus;
    PanelPanel1 *skeleton;
    std::unique_ptr<Panel> panel;
};

BusObject::BusObject(GDBusConnection *bus) : impl_(std::make_unique<Impl>(bus))
{
    GError *error = nullptr;
    if (!g_dbus_interface_skeleton_export(G_DBUS_INTERFACE_SKELETON(impl_->skeleton), bus,
                                          "/com/velmora/quickpanel", &error)) {
        const std::string reason = error->message;
        g_error_free(error);
        throw std::runtime_error("cannot export the panel: " + reason);
    }
}

void BusObject::start(Store &store)
{
    PanelPanel1 *skeleton = impl_->skeleton;
    impl_->panel = std::make_unique<Panel>(store, impl_->bus, [skeleton](const Event &event) {
        panel_panel1_emit_happened(skeleton, toVariant(event).get());
    });
}

BusObject::~BusObject() = default;

} // namespace pelliko::quickpanel
