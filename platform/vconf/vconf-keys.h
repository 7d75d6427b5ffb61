// Names of the configuration keys that the product reads.
#pragma once

/// bool: the modem can be asked.
#define VCONFKEY_TELEPHONY_READY "memory/telephony/telephony_ready"
/// text such as "en_GB.UTF-8": the device language; the session's while nobody has set one.
#define VCONFKEY_LANGSET "db/menu_widget/language"
