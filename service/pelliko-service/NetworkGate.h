#pragma once

#include <functional>
#include <string>

namespace pelliko::service
{

/** Says whether a request may send now. */
class NetworkGate
{
public:
    virtual ~NetworkGate() = default;

    /** @param server the share server's address @param wifiOnly whether metered networks are
     * forbidden */
    virtual bool open(const std::string &server, bool wifiOnly) const = 0;
};

/** The gate over the system's network monitor. */
class MonitorGate : public NetworkGate
{
public:
    /** @param changed called from the main loop when open() may answer otherwise than before */
    explicit MonitorGate(std::function<void()> changed);
    ~MonitorGate() override;
    MonitorGate(const MonitorGate &) = delete;
    MonitorGate &operator=(const MonitorGate &) = delete;

    bool open(const std::string &server, bool wifiOnly) const override;

private:
    std::function<void()> changed_;
    unsigned long networkHandler_ = 0;
    unsigned long meteredHandler_ = 0;
};

/** Whether an address names this machine. */
bool onLoopback(const std::string &server);

} // namespace pelliko::service
