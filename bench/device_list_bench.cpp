// "get" "all" of the device list in-process through ModuleManager::ProcessRequest on a simulated
// root: 1,000 ARP clients plus 1,000 wifi station records (half of them stations of ARP clients)
// merged into the list, which is then saved and answered. The scanners' lists are built here:
// live scans would run 1,000 iw programs and a real 13-second SSDP search per request. The
// baseline, measured in the same run, is the styled JSON text of the resulting list, which the
// save writes once per request. Pss of this process is read before and after the first request
// and across 100 repeated requests.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include "network/module/devicelist_module.h"
#include "network/module/module_manager.h"
#include "support/sim_root.h"

namespace {

using vornnetwork::network::module::BaseModule;
using vornnetwork::network::module::DeviceListModule;
using vornnetwork::network::module::MODULE_DEVICE_LIST;
using vornnetwork::network::module::ModuleManager;

constexpr int kClients = 1000;
constexpr int kRepeats = 100;

std::string Mac(int n) {
    char text[18];
    std::snprintf(text, sizeof text, "02:00:00:00:%02x:%02x", (n >> 8) & 0xff, n & 0xff);
    return text;
}

Json::Value ArpList() {
    Json::Value list(Json::objectValue);
    for (int n = 0; n < kClients; ++n) {
        Json::Value client;
        client["macAddr"] = Mac(n);
        client["ipAddr"] = "10.1." + std::to_string(n / 250) + "." + std::to_string(n % 250 + 1);
        client["netif"] = "br0";
        client["friendlyName"] = "host-" + std::to_string(n);
        list["ClientList"].append(client);
    }
    return list;
}

Json::Value WifiList() {
    Json::Value list(Json::objectValue);
    for (int n = kClients / 2; n < kClients / 2 + kClients; ++n) {
        Json::Value station;
        station["macAddr"] = Mac(n);
        station["connection"] = "wifi";
        station["netif"] = "wlan0";
        station["transferRX"] = std::to_string(n * 1000);
        station["transferTX"] = std::to_string(n * 700);
        station["signalstrength"] = n % 100;
        list["ClientList"].append(station);
    }
    return list;
}

// ARP and wifi give the lists above; UPnP and CV have found nothing.
class ListedDeviceListModule : public DeviceListModule {
  public:
    int GetArpScannerData(Json::Value& out) override {
        static const Json::Value arp = ArpList();
        out = arp;
        return 0;
    }
    int GetUpnpScannerData(Json::Value&) override { return 0; }
    int GetCVScannerData(Json::Value&) override { return 0; }
    int GetWifiScannerData(Json::Value& out) override {
        static const Json::Value wifi = WifiList();
        out = wifi;
        return 0;
    }
    static BaseModule* Create() { return new ListedDeviceListModule(); }
};

long PssKiB() {
    std::ifstream in("/proc/self/smaps_rollup");
    for (std::string line; std::getline(in, line);) {
        if (line.rfind("Pss:", 0) == 0) {
            return std::stol(line.substr(4));
        }
    }
    return -1;
}

Json::Value GetAll() {
    Json::Value request;
    request["method"] = "get";
    request["scannertype"] = "all";
    Json::Value answer;
    if (ModuleManager::GetInstance()->ProcessRequest(MODULE_DEVICE_LIST, request, answer) != 0) {
        std::fprintf(stderr, "get all failed\n");
    }
    return answer;
}

// A module with an empty list, as at the first start.
void FreshModule() {
    ModuleManager& manager = *ModuleManager::GetInstance();
    manager.RemoveModule(MODULE_DEVICE_LIST);
    manager.AddModule({MODULE_DEVICE_LIST, true, &ListedDeviceListModule::Create});
    manager.InitModules();
}

void BM_FirstGetAll(benchmark::State& state) {
    std::size_t entries = 0;
    for (auto _ : state) {
        state.PauseTiming();
        FreshModule();
        state.ResumeTiming();
        entries = GetAll()["ClientList"].size();
    }
    state.counters["entries"] = static_cast<double>(entries);
}
BENCHMARK(BM_FirstGetAll)->Unit(benchmark::kMillisecond);

void BM_RepeatedGetAll(benchmark::State& state) {
    FreshModule();
    const long beforeFirst = PssKiB();
    GetAll();
    const long afterFirst = PssKiB();
    long afterRepeats = afterFirst;
    for (auto _ : state) {
        for (int i = 0; i < kRepeats; ++i) {
            benchmark::DoNotOptimize(GetAll());
        }
        afterRepeats = PssKiB();
    }
    state.counters["pss_before_first_kB"] = static_cast<double>(beforeFirst);
    state.counters["pss_after_first_kB"] = static_cast<double>(afterFirst);
    state.counters["pss_after_100_more_kB"] = static_cast<double>(afterRepeats);
}
BENCHMARK(BM_RepeatedGetAll)->Iterations(3)->Unit(benchmark::kMillisecond);

// The baseline: the styled text of the merged list, as the save writes it.
void BM_StyledTextOfTheList(benchmark::State& state) {
    FreshModule();
    const Json::Value list = GetAll();
    for (auto _ : state) {
        std::ostringstream text;
        Json::StyledStreamWriter("\t").write(text, list);
        benchmark::DoNotOptimize(text.str());
    }
}
BENCHMARK(BM_StyledTextOfTheList)->Unit(benchmark::kMillisecond);

}  // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return 1;
    }
    vorn::test::SimRoot root;
    std::filesystem::create_directories(root.Path("/var/packages/Linkyard/target/data"));
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    ModuleManager::GetInstance()->RemoveModule(MODULE_DEVICE_LIST);
    return 0;
}
