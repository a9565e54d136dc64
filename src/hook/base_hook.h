#ifndef VORN_HOOK_BASE_HOOK_H
#define VORN_HOOK_BASE_HOOK_H

#include <map>
#include <string>

#include "platform/qlib_plugin.h"

namespace vornwireless {
namespace hook {

// A plug-in hook point with its named arguments; ExecHook runs it for a platform action code.
class BaseHook {
  public:
    BaseHook(const std::string& module, const std::string& path);
    virtual ~BaseHook();
    BaseHook(const BaseHook&) = delete;
    BaseHook& operator=(const BaseHook&) = delete;

    virtual bool IsValid() const { return true; }

    int SetEnv(const std::string& key, const std::string& value);
    std::string GetEnv(const std::string& key) const;
    bool ExecHook(int action);

  private:
    int Init();

    std::string module_;
    std::string path_;
    QLIBPLUGIN* handle_ = nullptr;
    std::map<std::string, std::string> env_;
};

class ArpIgnoreChangeHook : public BaseHook {
  public:
    explicit ArpIgnoreChangeHook(bool value);
};

class BondChangeHook : public BaseHook {
  public:
    explicit BondChangeHook(const std::string& action);
};

class GatewayChangeHook : public BaseHook {
  public:
    GatewayChangeHook(const std::string& action, const std::string& ifname,
                      const std::string& destination, const std::string& gateway);
    bool IsValid() const override;
};

class TopologyChangeHook : public BaseHook {
  public:
    TopologyChangeHook(const std::string& oldTopology, const std::string& newTopology);
    bool IsValid() const override;
};

enum IPTYPE { IPTYPE_IPV4 = 0, IPTYPE_IPV6 = 1 };

// Runs "net/ipv4_change" or "net/ipv6_change" at once. False when the arguments are not valid
// (empty name or new address, an unknown type, a prefix length above 32 or 128) or the run failed.
bool NetIPChangeEvent(IPTYPE type, const std::string& ifname, const std::string& origin,
                      const std::string& address, int prefixLength);

}  // namespace hook
}  // namespace vornwireless

#endif
