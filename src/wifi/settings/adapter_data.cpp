#include "wifi/settings/adapter_data.h"

#include <atomic>
#include <map>
#include <utility>
#include <vector>

#include "platform/qlibc_container.h"
#include "platform/qlibc_file.h"
#include "utils/config.h"
#include "utils/file.h"
#include "utils/log.h"
#include "utils/temp_file.h"
#include "wifi/adapter/adapter.h"
#include "wifi/settings/field_text.h"
#include "wifi/utils/utils.h"

namespace vornwireless {
namespace wifi {
namespace {

// SetReloadData as 0 or 1, joined with '|' rather than '||' so that every field is compared and
// assigned whatever came before.
template <typename T>
int Changed(T& stored, const T& incoming) {
    return SetReloadData(stored, incoming) ? 1 : 0;
}

constexpr const char* kWifiDir = "/usr/vorn/etc/wifi/";
constexpr const char* kObsoleteClientFile = "/usr/vorn/etc/wifi/wifi_client_obsolete";
constexpr const char* kHostapdDir = "/etc/hostapd";
constexpr const char* kMacFilterDir = "/etc/hostapd/mac_filter";
constexpr const char* kMacFilterInfo = "/etc/hostapd/mac_filter/mf.info";
constexpr const char* kMacFilterRules = "/etc/hostapd/mac_filter/mf.conf";
constexpr const char* kGeneral = "general";
constexpr const char* kClientEnabled = "clientenabled";
constexpr const char* kPairFormat = "\t%s=%s\n";
constexpr int kMaxClients = 256;
constexpr int kDefaultCountryRegion = 5;
constexpr int kDefaultCountryRegionABand = 7;
constexpr int kDefaultRadiusPort = 1812;

using Pairs = std::vector<std::pair<std::string, std::string>>;
using Lookup = std::map<std::string, std::string>;
struct Section {
    std::string name;
    Pairs pairs;
};

std::string AccessPointFile(const AdapterConfig& config) {
    return kWifiDir + std::string("wifi_ap_") + config.bssid.ToString();
}

std::string ClientFile(const AdapterConfig& config) {
    return kWifiDir + std::string("wifi_client_") + config.bssid.ToString();
}

struct Hash {
    QLIBSZHASH* hash = QLIBCSzHashAlloc(32);
    ~Hash() { QLIBCSzHashFree(hash); }
    bool Fill(const Pairs& pairs) {
        for (const auto& pair : pairs) {
            if (hash == nullptr ||
                QLIBCSzHashSetValue(hash, pair.first.c_str(), pair.second.c_str()) != 0) {
                return false;
            }
        }
        return hash != nullptr;
    }
};

// Section names in file order, or false when the file cannot be read.
bool SectionNames(const std::string& file, std::vector<std::string>& names) {
    QLIBSZLIST* list = QLIBCSzListAlloc(16);
    if (list == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate memory.");
        return false;
    }
    const bool ok = QLIBCFileEnumSection(file.c_str(), &list) >= 0;
    for (int i = 0; ok && i < QLIBCSzListCount(list); ++i) {
        names.push_back(QLIBCSzListGet(list, i));
    }
    QLIBCSzListFree(list);
    return ok;
}

// A section with at least one key, or false.
bool ReadSection(const std::string& file, const std::string& name, Lookup& pairs) {
    Hash section;
    if (section.hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to allocate memory");
        return false;
    }
    if (QLIBCFileGetSection(file.c_str(), name.c_str(), &section.hash) <= 0) {
        return false;
    }
    for (int i = 0; i < QLIBCSzHashCount(section.hash); ++i) {
        pairs[QLIBCSzHashKeyAt(section.hash, i)] = QLIBCSzHashValueAt(section.hash, i);
    }
    return true;
}

// Sections in the given order, replacing the file at once: a failed write leaves the old file.
bool WriteSections(const std::string& file, const std::vector<Section>& sections,
                   std::string& failed) {
    vornwireless::utils::TempFile temp(file);
    FILE* stream = temp.Open();
    bool ok = stream != nullptr;
    for (auto section = sections.begin(); ok && section != sections.end(); ++section) {
        Hash pairs;
        ok = pairs.Fill(section->pairs) &&
             QLIBCFileHash2File(stream, section->name.c_str(), pairs.hash, kPairFormat) == 0;
        if (!ok) {
            failed = section->name;
        }
    }
    ok = temp.Close() && ok && QLIBCSysRename(temp.Logical().c_str(), file.c_str()) == 0;
    if (!ok && temp.Created()) {
        QLIBCSysUnlink(temp.Logical().c_str());
    }
    return ok;
}

// Reads the fields present in a section; an absent key keeps the value already there.
class FromSection {
  public:
    explicit FromSection(const Lookup& pairs) : pairs_(pairs) {}

    template <typename T>
    void operator()(const char* key, T& value) {
        const auto found = pairs_.find(key);
        if (found != pairs_.end() && !FromText(found->second, value)) {
            VORN_LOG(LOG_ERR, "Bad value [%s] of key [%s]", found->second.c_str(), key);
            ok_ = false;
        }
    }
    template <typename Text>
    void operator()(const char* key, const Secret<Text>& secret) {
        const auto found = pairs_.find(key);
        if (found != pairs_.end() && utils::DecryptCipherText(found->second, secret.text) != 0) {
            VORN_LOG(LOG_ERR, "Failed to decrypt cipher text");
            ok_ = false;
        }
    }
    bool Ok() const { return ok_; }

  private:
    const Lookup& pairs_;
    bool ok_ = true;
};

class ToSection {
  public:
    template <typename T>
    void operator()(const char* key, const T& value) {
        pairs_.emplace_back(key, ToText(value));
    }
    template <typename Text>
    void operator()(const char* key, const Secret<Text>& secret) {
        std::string cipher;
        if (ok_ && utils::EncryptPlainText(secret.text, cipher) != 0) {
            VORN_LOG(LOG_ERR, "Failed to Encrypt plain text");
            ok_ = false;
        }
        pairs_.emplace_back(key, cipher);
    }
    bool Ok() const { return ok_; }
    const Pairs& Result() const { return pairs_; }

  private:
    Pairs pairs_;
    bool ok_ = true;
};

// The radio's own report decides: the first of a, n, g, b it names, else gn.
WIFI_MODE ProbeDefaultMode(const std::string& name) {
    std::string modes;
    if (utils::GetSupportedMode(name, modes) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get iwconfig (%s), set default mode to gn", name.c_str());
        return WIFI_MODE_GN;
    }
    const std::pair<char, WIFI_MODE> order[] = {
        {'a', WIFI_MODE_A}, {'n', WIFI_MODE_N}, {'g', WIFI_MODE_G}, {'b', WIFI_MODE_B}};
    for (const auto& letter : order) {
        if (modes.find(letter.first) != std::string::npos) {
            return letter.second;
        }
    }
    return WIFI_MODE_GN;
}

void SetFirstStartDefaults(AdapterConfig& c, WIFI_MODE mode) {
    c.enabled = true;
    c.ssid = "Cindervault";
    c.display_ssid = true;
    c.mode = mode;
    c.bandwidth = WIFI_BANDWIDTH_20_40MHZ;
    c.channel = 0;
    c.tx_power = WIFI_POWER_HIGH;
    c.max_num_client = kMaxClients;
    c.wmm_enabled = true;
    c.schedule_enabled = false;
    c.schedule.fill(false);
    c.CountryCode.clear();
    c.CountryRegion = kDefaultCountryRegion;
    c.CountryRegionABand = kDefaultCountryRegionABand;
    c.security = WIFI_SECURITY_DISABLED;
    c.encryption = WIFI_ENCRYPTION_AES;
    c.auth_server_Port = kDefaultRadiusPort;
    c.guest_support = utils::IsGuestNetworkSupport(c.name);
    c.guest_enabled = false;
    c.guest_ssid = "CindervaultGuest";
    c.guest_display_ssid = true;
    c.guest_bssid = c.bssid + 1;
    c.guest_max_num_client = kMaxClients;
    c.guest_security = WIFI_SECURITY_DISABLED;
    c.guest_encryption = WIFI_ENCRYPTION_AES;
    c.guest_allow_access_guest = false;
    c.guest_allow_access_lan = false;
    c.guest_allow_access_http_https_only = false;
    c.guest_schedule_enabled = false;
    c.guest_schedule.fill(false);
    c.mac_filter_policy = WIFI_MAC_FILTER_POLICY_DENY;
    c.is_pci_interface = utils::IsKiteBuiltInWlan(c.name);
}

}  // namespace

AdapterData::AdapterData(const std::string& name) : config_(new AdapterConfig()) {
    config_->name = name;
    NewRevision();
}

void AdapterData::NewRevision() {
    static std::atomic<std::uint64_t> last{0};
    revision_ = ++last;
}

AdapterData::~AdapterData() = default;

AdapterData* AdapterData::Create(const std::string& name) {
    std::unique_ptr<AdapterData> data(new AdapterData(name));
    if (data->Read() != 0) {
        return nullptr;
    }
    data->EnableReloadStatus();
    return data.release();
}

int AdapterData::Delete(AdapterData* data) {
    delete data;
    return 0;
}

bool AdapterData::NeedReload() const {
    return reload_.restart || reload_.tx_power || reload_.schedule || reload_.guest_schedule ||
           reload_.guest_rule;
}

int AdapterData::Read() {
    AdapterConfig config;
    config.name = config_->name;
    const std::string mac = utils::GetBssid(config.name);
    if (mac.empty() || !FromText(mac, config.bssid)) {
        VORN_LOG(LOG_ERR, "Failed to get BSSID[%s]", config.name.c_str());
        VORN_LOG(LOG_ERR, "Failed to get Config value");
        return -1;
    }
    config.driver = WIFI_DRIVER_NL80211;
    if (ReadAccessPoint(config) != 0 || ReadMacFilter(config) != 0 || ReadClient(config) != 0) {
        VORN_LOG(LOG_ERR, "Failed to get Config value");
        return -1;
    }
    *config_ = config;
    NewRevision();
    return 0;
}

int AdapterData::ReadAccessPoint(AdapterConfig& config) const {
    const std::string file = AccessPointFile(config);
    if (QLIBCFileExist(file.c_str()) <= 0) {
        SetFirstStartDefaults(config, ProbeDefaultMode(config.name));
        return 0;
    }
    Lookup pairs;
    SetFirstStartDefaults(config, WIFI_MODE_GN);
    // A file that lacks them asks for a secured network.
    config.security = WIFI_SECURITY_PERSONAL_WPA2;
    config.guest_security = WIFI_SECURITY_PERSONAL_WPA2;
    FromSection read(pairs);
    if (ReadSection(file, kGeneral, pairs)) {
        VisitAccessPointFields(config, read);
    }
    if (pairs.empty() || !read.Ok()) {
        VORN_LOG(LOG_ERR, "Failed to get AP value");
        return -1;
    }
    if (pairs.count("mode") == 0) {
        config.mode = ProbeDefaultMode(config.name);
    }
    return 0;
}

int AdapterData::ReadMacFilter(AdapterConfig& config) const {
    if (QLIBCFileExist(kMacFilterRules) <= 0) {
        return 0;
    }
    std::vector<std::string> names;
    bool ok = SectionNames(kMacFilterRules, names) && !names.empty();
    for (auto name = names.begin(); ok && name != names.end(); ++name) {
        Lookup pairs;
        AdapterConfig::MacFilterRule rule;
        FromSection read(pairs);
        ok = ReadSection(kMacFilterRules, *name, pairs);
        VisitMacFilterRuleFields(rule, read);
        ok = ok && read.Ok();
        config.mac_filter_rules.push_back(rule);
    }
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to get MacFilter value");
        return -1;
    }
    return 0;
}

void AdapterData::MoveObsoleteClientFile(const std::string& clientFile) const {
    if (QLIBCFileExist(kObsoleteClientFile) > 0 &&
        QLIBCSysRename(kObsoleteClientFile, clientFile.c_str()) != 0) {
        VORN_LOG(LOG_ERR, "Failed to change file name for obsolete file [%s]", kObsoleteClientFile);
    }
}

int AdapterData::ReadClient(AdapterConfig& config) const {
    const std::string file = ClientFile(config);
    MoveObsoleteClientFile(file);
    config.client_enabled = false;
    if (QLIBCFileExist(file.c_str()) <= 0) {
        return 0;
    }
    config.client_enabled = true;
    std::vector<std::string> names;
    bool ok = SectionNames(file, names);
    for (auto name = names.begin(); ok && name != names.end(); ++name) {
        Lookup pairs;
        FromSection read(pairs);
        // A general section without keys leaves the client enabled.
        ok = ReadSection(file, *name, pairs) || *name == kGeneral;
        if (*name == kGeneral) {
            read(kClientEnabled, config.client_enabled);
        } else {
            AdapterConfig::StationInfo station;
            FromText(*name, station.bssid);
            VisitStationFields(station, read);
            ok = ok && station.bssid.IsFormalized();
            config.stations.push_back(station);
        }
        ok = ok && read.Ok();
    }
    if (!ok) {
        VORN_LOG(LOG_ERR, "Failed to get Client value");
        return -1;
    }
    return 0;
}

int AdapterData::Write() const {
    switch (Adapter::GetTopology()) {
        case WIFI_TOPOLOGY_ROUTER:
        case WIFI_TOPOLOGY_BRIDGE:
            WriteAccessPoint();
            WriteClient();
            break;
        case WIFI_TOPOLOGY_CLIENT:
            WriteClient();
            break;
        default:
            break;
    }
    return 0;
}

void AdapterData::WriteAccessPoint() const {
    if (vornwireless::utils::CheckAndMakeDir(kWifiDir, 0755) != 0) {
        VORN_LOG(LOG_ERR, "Failed to mkdir %s", kWifiDir);
        return;
    }
    ToSection general;
    VisitAccessPointFields(*config_, general);
    if (!general.Ok()) {
        return;
    }
    Hash pairs;
    if (pairs.hash == nullptr) {
        VORN_LOG(LOG_ERR, "Failed to alloc memory");
        return;
    }
    WriteMacFilter();
    const std::string file = AccessPointFile(*config_);
    if (!pairs.Fill(general.Result()) ||
        QLIBCFileAddSection(file.c_str(), kGeneral, pairs.hash, kPairFormat) != 0) {
        VORN_LOG(LOG_ERR, "Failed to add section [%s] to file", kGeneral);
    }
}

void AdapterData::WriteMacFilter() const {
    for (const char* dir : {kHostapdDir, kMacFilterDir}) {
        if (vornwireless::utils::CheckAndMakeDir(dir, 0755) != 0) {
            VORN_LOG(LOG_ERR, "Failed to mkdir %s", dir);
            return;
        }
    }
    vornwireless::utils::ConfigNoSection info(kMacFilterInfo);
    info.AddKeyValue("policy", ToText(config_->mac_filter_policy));
    if (info.Write() != 0) {
        VORN_LOG(LOG_ERR, "Failed to write value [%s] to file [%s]",
                 ToText(config_->mac_filter_policy).c_str(), kMacFilterInfo);
    }
    std::vector<Section> rules;
    for (const auto& rule : config_->mac_filter_rules) {
        ToSection pairs;
        VisitMacFilterRuleFields(rule, pairs);
        rules.push_back({std::to_string(rules.size()), pairs.Result()});
    }
    std::string failed;
    if (rules.empty()) {
        QLIBCSysUnlink(kMacFilterRules);
    } else if (!WriteSections(kMacFilterRules, rules, failed)) {
        VORN_LOG(LOG_ERR, "Failed to add section [%s] to file", failed.c_str());
    }
}

void AdapterData::WriteClient() const {
    if (vornwireless::utils::CheckAndMakeDir(kWifiDir, 0755) != 0) {
        VORN_LOG(LOG_ERR, "Failed to mkdir %s", kWifiDir);
        return;
    }
    std::vector<Section> sections{{kGeneral, {{kClientEnabled, ToText(config_->client_enabled)}}}};
    for (const auto& station : config_->stations) {
        ToSection pairs;
        VisitStationFields(station, pairs);
        if (!pairs.Ok()) {
            return;
        }
        sections.push_back({station.bssid.ToString(), pairs.Result()});
    }
    std::string failed;
    if (!WriteSections(ClientFile(*config_), sections, failed)) {
        if (failed == kGeneral) {
            VORN_LOG(LOG_ERR, "Failed to write client enabled");
        } else {
            VORN_LOG(LOG_ERR, "Failed to add section [%s] to file", failed.c_str());
        }
    }
}

int AdapterData::SetConfig(const AdapterConfig& config) {
    if (&config == config_.get()) {
        return 0;
    }
    std::vector<AdapterConfig::StationInfo> stations = config.stations;
    switch (Adapter::GetTopology()) {
        case WIFI_TOPOLOGY_BRIDGE:
        case WIFI_TOPOLOGY_ROUTER:
            SetAPConfig(config);
            break;
        case WIFI_TOPOLOGY_CLIENT:
            if (SetClientConfig(config) == 0) {
                stations = config_->stations;
            }
            break;
        default:
            VORN_LOG(LOG_ERR, "Bad topology [%d]", static_cast<int>(Adapter::GetTopology()));
            return -1;
    }
    *config_ = config;
    config_->stations = stations;
    NewRevision();
    return 0;
}

int AdapterData::SetAPConfig(const AdapterConfig& n) {
    AdapterConfig& c = *config_;
    if (Changed(c.enabled, n.enabled) | Changed(c.guest_enabled, n.guest_enabled)) {
        reload_.restart = true;
        reload_.guest_rule = true;
    }
    const bool restart =
        Changed(c.ssid, n.ssid) | Changed(c.display_ssid, n.display_ssid) |
        Changed(c.mode, n.mode) | Changed(c.bandwidth, n.bandwidth) |
        Changed(c.channel, n.channel) | Changed(c.wmm_enabled, n.wmm_enabled) |
        Changed(c.CountryCode, n.CountryCode) | Changed(c.CountryRegion, n.CountryRegion) |
        Changed(c.CountryRegionABand, n.CountryRegionABand) | Changed(c.security, n.security) |
        Changed(c.encryption, n.encryption) | Changed(c.password, n.password) |
        Changed(c.auth_server_ip, n.auth_server_ip) |
        Changed(c.auth_server_Port, n.auth_server_Port) |
        Changed(c.auth_server_shared_secret, n.auth_server_shared_secret) |
        Changed(c.guest_support, n.guest_support) | Changed(c.guest_ssid, n.guest_ssid) |
        Changed(c.guest_display_ssid, n.guest_display_ssid) |
        Changed(c.guest_max_num_client, n.guest_max_num_client) |
        Changed(c.guest_security, n.guest_security) |
        Changed(c.guest_encryption, n.guest_encryption) |
        Changed(c.guest_password, n.guest_password) |
        Changed(c.guest_allow_access_guest, n.guest_allow_access_guest) |
        Changed(c.mac_filter_policy, n.mac_filter_policy) |
        Changed(c.mac_filter_rules, n.mac_filter_rules);
    reload_.restart = reload_.restart || restart;
    reload_.tx_power = SetReloadData(c.tx_power, n.tx_power) || reload_.tx_power;
    reload_.schedule = SetReloadData(c.schedule_enabled, n.schedule_enabled);
    reload_.guest_schedule =
        SetReloadData(c.guest_schedule_enabled, n.guest_schedule_enabled) || reload_.guest_schedule;
    if (Changed(c.guest_allow_access_lan, n.guest_allow_access_lan) |
        Changed(c.guest_allow_access_http_https_only, n.guest_allow_access_http_https_only)) {
        reload_.guest_rule = true;
    }
    c.schedule = n.schedule;
    c.guest_schedule = n.guest_schedule;
    NewRevision();
    return 0;
}

int AdapterData::SetClientConfig(const AdapterConfig& config) {
    if (config.stations.empty()) {
        VORN_LOG(LOG_ERR, "stationList is null");
        return -1;
    }
    const AdapterConfig::StationInfo& station = config.stations.front();
    auto& known = config_->stations;
    for (auto it = known.begin(); it != known.end(); ++it) {
        if (it->bssid == station.bssid) {
            known.erase(it);
            break;
        }
    }
    known.push_back(station);
    NewRevision();
    return 0;
}

}  // namespace wifi
}  // namespace vornwireless
