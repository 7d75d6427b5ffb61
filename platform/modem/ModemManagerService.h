// The modems of a machine that runs ModemManager.
#pragma once

#include "ModemService.h"

#include <chrono>
#include <memory>

namespace pelliko::modem
{

class ModemManagerService final : public ModemService
{
public:
    /// How long a question and a message may take altogether. A long message goes out in several
    /// parts, for each of which a slow network may take half a minute.
    explicit ModemManagerService(std::chrono::milliseconds readLimit = std::chrono::seconds(5),
                                 std::chrono::milliseconds sendLimit = std::chrono::minutes(2));
    ~ModemManagerService() override;

    const char *busName() const override;
    std::optional<ModemList> read() override;
    void listen(std::function<void()> changed) override;
    [[nodiscard]] std::string sendSms(int slot, const std::string &to,
                                      const std::string &text) override;

private:
    struct Listener;

    std::chrono::milliseconds readLimit_;
    std::chrono::milliseconds sendLimit_;
    std::unique_ptr<Listener> listener_;
};

} // namespace pelliko::modem
