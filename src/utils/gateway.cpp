#include "utils/gateway.h"

#include "platform/qlibc_error.h"
#include "platform/vorn_net.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

constexpr int kEventLevel = 2;
constexpr int kEventCategory = 1;

// What a user would call the previous gateway: the running one, or the configured one when only
// that differs from the new gateway.
const IPAddress& Previous(const IPAddress& running, const IPAddress& configured,
                          const IPAddress& gw) {
    return running != gw ? running : configured;
}

void RecordChange(const IPAddress& previous, const IPAddress& gw) {
    int result = 0;
    if (previous.IsEmpty()) {
        result =
            VORNLogSet1(kEventLevel, kEventCategory, Gateway::kEventSet, gw.ToCString(), nullptr);
    } else if (gw.IsEmpty()) {
        result = VORNLogSet1(kEventLevel, kEventCategory, Gateway::kEventRemoved,
                             previous.ToCString(), nullptr);
    } else {
        result = VORNLogSet1(kEventLevel, kEventCategory, Gateway::kEventChanged,
                             previous.ToCString(), gw.ToCString(), nullptr);
    }
    if (result != 0) {
        VORN_LOG(LOG_WARNING, "Failed to record gateway change to [%s]", gw.ToCString());
    }
}

}  // namespace

int Gateway::Get(IPAddress& out) const {
    char buffer[20] = {};
    if (VORNNetDefaultGatewayGet(buffer, sizeof(buffer)) != 0) {
        VORN_LOG(LOG_ERR, "get gateway failed [0x%04X]", QLIBCErrGet());
        return -1;
    }
    out = std::string(buffer);
    return 0;
}

int Gateway::GetConfig(IPAddress& out) const {
    char buffer[20] = {};
    if (VORNNetDefaultGatewayGetConf(buffer, sizeof(buffer)) != 0) {
        VORN_LOG(LOG_ERR, "get gateway config failed [0x%04X]", QLIBCErrGet());
        return -1;
    }
    out = std::string(buffer);
    return 0;
}

int Gateway::Backup() {
    IPAddress gw;
    if ((Get(gw) != 0 || gw.IsEmpty()) && (GetConfig(gw) != 0 || gw.IsEmpty())) {
        VORN_LOG(LOG_ERR, "Failed to backup gateway");
        return -1;
    }
    saved_ = gw;
    return 0;
}

int Gateway::Set(const IPAddress& gw) {
    IPAddress running;
    IPAddress configured;
    if (Get(running) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get gateway");
        return -1;
    }
    if (GetConfig(configured) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get gateway conf");
        return -1;
    }
    if (gw == running && gw == configured) {
        return 0;
    }
    const char* address = gw.IsEmpty() ? nullptr : gw.ToCString();
    if (VORNNetDefaultGatewaySetConf(address) != 0) {
        VORN_LOG(LOG_ERR, "set gateway conf failed");
        return -1;
    }
    if (VORNNetDefaultGatewaySet(address) != 0) {
        VORN_LOG(LOG_ERR, "set gateway failed");
        return -1;
    }
    RecordChange(Previous(running, configured, gw), gw);
    return 0;
}

int Gateway::Restore() {
    if (saved_.IsEmpty()) {
        return -1;
    }
    return Set(saved_);
}

}  // namespace utils
}  // namespace vornwireless
