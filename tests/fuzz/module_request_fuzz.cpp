// A request of vornnetd's D-Bus methods as its modules get it: the first byte picks the module,
// the rest is the JSON text. The modules run as in the daemon, started on a scratch appliance.
#include <json/json.h>

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <iterator>
#include <string>

#include "network/module/module_manager.h"
#include "require.h"
#include "scratch_world.h"
#include "utils/json_text.h"

namespace {

using vornnetwork::network::module::ModuleManager;

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    EnterScratchWorld({"/etc/config", "/etc/sysconfig/network-scripts", "/var/run", "/tmp"});
    ModuleManager::GetInstance()->Initialize();
    ModuleManager::GetInstance()->Start();
    // As the daemon does on its way out; the manager does not own its modules.
    std::atexit([] {
        for (const auto& row : ModuleManager::module_info) {
            ModuleManager::GetInstance()->RemoveModule(row.type);
        }
    });
    return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Json::Value request;
    if (size == 0 || !vornwireless::utils::ParseJson(
                         std::string(reinterpret_cast<const char*>(data) + 1, size - 1), request)) {
        return 0;
    }
    const auto& row = ModuleManager::module_info[data[0] % std::size(ModuleManager::module_info)];
    Json::Value answer;
    const int result = ModuleManager::GetInstance()->ProcessRequest(row.type, request, answer);
    // The route module says why it refused.
    Require(row.type != vornnetwork::network::module::MODULE_ROUTE || result == 0 ||
            !answer["error"].asString().empty());
    return 0;
}
