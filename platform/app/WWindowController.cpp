#include "WWindowControllerImpl.h"

namespace app_assist
{

namespace
{

constexpr int kHandsetNotificationType = 12;

Elm_Win_Type hostType(Elm_Win_Type type)
{
    return static_cast<int>(type) == kHandsetNotificationType ? NOTIFICATION_WINDOW_TYPE : type;
}

// Windows of a handset are as large as its screen; a desktop leaves one that was given no size at a
// single pixel.
void giveSize(Evas_Object *window)
{
    int width = 0, height = 0;
    evas_object_geometry_get(window, nullptr, nullptr, &width, &height);
    if (width > 1 && height > 1)
        return;
    elm_win_screen_size_get(window, nullptr, nullptr, &width, &height);
    evas_object_resize(window, width, height);
}

} // namespace

WWindowController::WWindowController(const char *name, Elm_Win_Type type) : impl_(new Impl)
{
    impl_->name = name ? name : "";
    impl_->type = hostType(type);
}

WWindowController::~WWindowController()
{
    impl_->forget();
    delete impl_;
}

void WWindowController::setCreateWindowFn(const CreateWindowFn &fn)
{
    impl_->createWindow = fn;
}

void WWindowController::setCreateBaseLayoutFn(const CreateBaseLayoutFn &fn)
{
    impl_->createBaseLayout = fn;
}

const char *WWindowController::getName() const
{
    return impl_->name.c_str();
}

Elm_Win_Type WWindowController::getWindowType() const
{
    return impl_->type;
}

Evas_Object *WWindowController::getWindow() const
{
    return impl_->window;
}

Evas_Object *WWindowController::getBaseLayout() const
{
    return impl_->layout;
}

bool WWindowController::Impl::create()
{
    window = createWindow ? createWindow(name.c_str(), type) : nullptr;
    if (!window)
        return false;
    giveSize(window);
    evas_object_event_callback_add(window, EVAS_CALLBACK_SHOW, onShowOrHide, this);
    evas_object_event_callback_add(window, EVAS_CALLBACK_HIDE, onShowOrHide, this);
    evas_object_event_callback_add(window, EVAS_CALLBACK_DEL, onDeleted, this);
    base = createBaseLayout ? createBaseLayout(window, &layout) : window;
    if (layout)
        evas_object_event_callback_add(layout, EVAS_CALLBACK_DEL, onLayoutDeleted, this);
    return true;
}

void WWindowController::Impl::forget()
{
    if (layout)
        evas_object_event_callback_del_full(layout, EVAS_CALLBACK_DEL, onLayoutDeleted, this);
    if (window) {
        evas_object_event_callback_del_full(window, EVAS_CALLBACK_SHOW, onShowOrHide, this);
        evas_object_event_callback_del_full(window, EVAS_CALLBACK_HIDE, onShowOrHide, this);
        evas_object_event_callback_del_full(window, EVAS_CALLBACK_DEL, onDeleted, this);
    }
    window = nullptr;
    base = nullptr;
    layout = nullptr;
}

bool WWindowController::Impl::visible() const
{
    return window && evas_object_visible_get(window);
}

void WWindowController::Impl::onShowOrHide(void *data, Evas *, Evas_Object *, void *)
{
    const auto *self = static_cast<Impl *>(data);
    if (self->visibilityChanged)
        self->visibilityChanged();
}

void WWindowController::Impl::onDeleted(void *data, Evas *, Evas_Object *, void *)
{
    auto *self = static_cast<Impl *>(data);
    self->window = nullptr;
    self->base = nullptr;
    if (self->visibilityChanged)
        self->visibilityChanged();
}

void WWindowController::Impl::onLayoutDeleted(void *data, Evas *, Evas_Object *, void *)
{
    static_cast<Impl *>(data)->layout = nullptr;
}

} // namespace app_assist
