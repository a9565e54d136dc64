#include "utils/net_link_flag.h"

#include <unistd.h>

#include "platform/qlibc_file.h"
#include "platform/qlibc_proc.h"
#include "platform/root_path.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

const char* const kFlagFile = "/tmp/.net_link_is_processing";

}  // namespace

void SetNetLinkIsProcessing() {
    if (QLIBCProcPidFileCreate(kFlagFile) != 0) {
        VORN_LOG(LOG_ERR, "Failed to write pid file: %s", kFlagFile);
    }
}

void UnsetNetLinkIsProcessing() {
    if (unlink(vorn::platform::RootPath(kFlagFile).c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to unlike pid file: %s", kFlagFile);
    }
}

bool IsNetLinkProcessing() {
    if (QLIBCFileExist(kFlagFile) <= 0) {
        return false;
    }
    const int pid = QLIBCReadPidFile(kFlagFile);
    return pid > 0 && QLIBCProcAlive(pid) == 1;
}

}  // namespace utils
}  // namespace vornwireless
