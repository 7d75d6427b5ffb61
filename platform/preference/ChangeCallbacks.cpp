#include "ChangeCallbacks.h"

#include <Ecore.h>

#include <cstdint>
#include <deque>
#include <map>
#include <mutex>
#include <optional>

namespace pelliko::preference
{

namespace
{

struct Registration {
    // Stays the same while one callback is registered again and again, so that a set between two
    // registrations is still delivered; another callback, or one set after an unset, gets a new
    // one.
    std::uint64_t id;
    preference_changed_cb callback;
    void *userData;
};

struct Delivery {
    std::string key;
    std::uint64_t registration;
};

std::mutex callbackMutex;
std::map<std::string, Registration> registrations;
std::deque<Delivery> deliveries;
std::uint64_t lastRegistration = 0;

std::optional<Registration> takeNext(std::string *key)
{
    const std::lock_guard<std::mutex> lock(callbackMutex);
    if (deliveries.empty())
        return std::nullopt;
    const Delivery delivery = deliveries.front();
    deliveries.pop_front();
    const auto found = registrations.find(delivery.key);
    if (found == registrations.end() || found->second.id != delivery.registration)
        return std::nullopt;
    *key = delivery.key;
    return found->second;
}

// One call of this for each queued delivery.
void deliverNext(void *)
{
    std::string key;
    if (const std::optional<Registration> target = takeNext(&key))
        target->callback(key.c_str(), target->userData);
}

bool queue(const std::string &key)
{
    const std::lock_guard<std::mutex> lock(callbackMutex);
    const auto found = registrations.find(key);
    if (found == registrations.end())
        return false;
    deliveries.push_back({key, found->second.id});
    return true;
}

} // namespace

void setCallback(const std::string &key, preference_changed_cb callback, void *userData)
{
    const std::lock_guard<std::mutex> lock(callbackMutex);
    const auto [at, fresh] = registrations.try_emplace(key, Registration{0, callback, userData});
    if (fresh || at->second.callback != callback)
        at->second.id = ++lastRegistration;
    at->second.callback = callback;
    at->second.userData = userData;
}

bool unsetCallback(const std::string &key)
{
    const std::lock_guard<std::mutex> lock(callbackMutex);
    return registrations.erase(key) > 0;
}

void valueWasSet(const std::string &key)
{
    if (!queue(key))
        return;
    // On the main thread the thread-safe call would run at once, inside the set.
    if (eina_main_loop_is())
        ecore_job_add(deliverNext, nullptr);
    else
        ecore_main_loop_thread_safe_call_async(deliverNext, nullptr);
}

} // namespace pelliko::preference
