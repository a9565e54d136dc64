#include "wifi/adapter/adapter_agent_hostapd_bridge.h"
