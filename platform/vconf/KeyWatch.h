// Tells about sets of configuration keys, by whatever process.
#pragma once

#include "vconf.h"

#include <map>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::vconf
{

/// Main loop only; events come from GLib's default main context.
class KeyWatch
{
public:
    KeyWatch();
    ~KeyWatch();
    KeyWatch(const KeyWatch &) = delete;
    KeyWatch &operator=(const KeyWatch &) = delete;

    /// False when the pair is known already or the key cannot be watched.
    bool add(const std::string &key, vconf_callback_fn callback, void *userData);
    /// False when the pair is not known.
    bool remove(const std::string &key, vconf_callback_fn callback);

private:
    struct Listener {
        std::string key;
        vconf_callback_fn callback;
        void *userData;
    };
    using ListenerPtr = std::shared_ptr<Listener>;
    using Listeners = std::vector<ListenerPtr>;

    Listeners::iterator find(const std::string &key, vconf_callback_fn callback);
    bool watchFolderOf(const std::string &key);
    void readEvents();
    void keyWasSet(const std::string &key);
    void eventsWereLost();

    int inotify_ = -1;
    unsigned source_ = 0;
    /// Folder part of keys ("db/menu_widget") by watch descriptor.
    std::map<int, std::string> folders_;
    Listeners listeners_;
};

} // namespace pelliko::vconf
