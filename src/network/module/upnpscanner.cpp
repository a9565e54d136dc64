#include "network/module/upnpscanner.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <upnp.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <memory>
#include <thread>

#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr std::uint16_t kPort = 49500;
constexpr int kMaxAnswerDelay = 10;  // seconds a device may wait before it answers
constexpr auto kAnswerTime = std::chrono::seconds(13);
constexpr std::size_t kMaxTextLength = 256;
constexpr std::size_t kMaxLocationLength = 1024;
constexpr std::size_t kMaxDescriptionLength = 64 * 1024;
constexpr const char* kNameTags[] = {"deviceType", "modelName", "modelDescription", "friendlyName",
                                     "manufacturer"};

// A device's own text made fit for the list: control characters as blanks, trimmed, at most
// kMaxTextLength bytes. ixml hands out valid UTF-8 only; a cut never splits a character.
std::string CleanText(const char* raw) {
    if (raw == nullptr) {
        return std::string();
    }
    std::string text(raw, strnlen(raw, kMaxTextLength + 1));
    if (text.size() > kMaxTextLength) {
        std::size_t cut = kMaxTextLength;
        while (cut > 0 && (static_cast<unsigned char>(text[cut]) & 0xc0) == 0x80) {
            --cut;
        }
        text.resize(cut);
    }
    for (char& c : text) {
        if (static_cast<unsigned char>(c) < 0x20 || c == 0x7f) {
            c = ' ';
        }
    }
    const std::size_t first = text.find_first_not_of(' ');
    if (first == std::string::npos) {
        return std::string();
    }
    return text.substr(first, text.find_last_not_of(' ') - first + 1);
}

// The first child's value of the first element named tag; empty when there is none.
std::string SearchValueByTagName(IXML_Document* document, const char* tag) {
    IXML_NodeList* elements = ixmlDocument_getElementsByTagName(document, tag);
    if (elements == nullptr) {
        return std::string();
    }
    IXML_Node* element = ixmlNodeList_item(elements, 0);
    IXML_Node* child = element != nullptr ? ixmlNode_getFirstChild(element) : nullptr;
    std::string value = child != nullptr ? CleanText(ixmlNode_getNodeValue(child)) : std::string();
    ixmlNodeList_free(elements);
    return value;
}

std::string AddressText(const sockaddr_storage* address) {
    char text[INET6_ADDRSTRLEN] = "";
    if (address == nullptr) {
        return text;
    }
    if (address->ss_family == AF_INET) {
        sockaddr_in ipv4;
        std::memcpy(&ipv4, address, sizeof ipv4);
        inet_ntop(AF_INET, &ipv4.sin_addr, text, sizeof text);
    } else if (address->ss_family == AF_INET6) {
        sockaddr_in6 ipv6;
        std::memcpy(&ipv6, address, sizeof ipv6);
        inet_ntop(AF_INET6, &ipv6.sin6_addr, text, sizeof text);
    }
    return text;
}

void HandleDiscoveryEvent(UpnpScanner& scanner, const UpnpDiscovery* event) {
    if (event == nullptr) {
        VORN_LOG(LOG_WARNING, "Warning: null event for handlediscovery");
        return;
    }
    // libupnp keeps the answer's source in the field it calls the destination.
    const char* location = UpnpDiscovery_get_Location_cstr(event);
    scanner.HandleDiscovery(AddressText(UpnpDiscovery_get_DestAddr(event)),
                            location != nullptr ? location : "");
}

// Runs on libupnp's threads: nothing may escape into its C code.
int CallbackEventHandler(Upnp_EventType type, const void* event, void* cookie) {
    try {
        if (type == UPNP_DISCOVERY_ADVERTISEMENT_ALIVE || type == UPNP_DISCOVERY_SEARCH_RESULT) {
            HandleDiscoveryEvent(*static_cast<UpnpScanner*>(cookie),
                                 static_cast<const UpnpDiscovery*>(event));
        } else if (type < UPNP_CONTROL_ACTION_REQUEST || type > UPNP_EVENT_SUBSCRIPTION_EXPIRED) {
            VORN_LOG(LOG_ERR, "Error in TvDeviceCallbackEventHandler: unknown event type %d",
                     static_cast<int>(type));
        }
    } catch (const std::exception& error) {
        VORN_LOG(LOG_ERR, "Failed to handle upnp event: %s", error.what());
    }
    return 0;
}

}  // namespace

std::atomic<bool> UpnpScanner::searching_{false};

UpnpScanner* UpnpScanner::Inst() {
    // Never destroyed: a detached search may still run at exit.
    static UpnpScanner* const instance = new UpnpScanner(kPort);
    return instance;
}

Json::Value UpnpScanner::GetData() {
    BoardcastUpnp();
    return GetFinishedList();
}

int UpnpScanner::BoardcastUpnp() {
    if (searching_.exchange(true)) {
        return 0;
    }
    if (pthread_create(&thread_, nullptr, &UpnpScanner::WaitBoardcastFinish, this) != 0) {
        VORN_LOG(LOG_ERR, "failed to create thread");
        searching_ = false;
        return -1;
    }
    pthread_detach(thread_);
    return 0;
}

void* UpnpScanner::WaitBoardcastFinish(void* scannerPointer) {
    auto* scanner = static_cast<UpnpScanner*>(scannerPointer);
    scanner->EraseList();
    if (scanner->StartUpnp() != 0) {
        VORN_LOG(LOG_ERR, "Error: cannot start upnp");
    } else {
        const int result = UpnpSearchAsync(scanner->handle_, kMaxAnswerDelay, "ssdp:all", scanner);
        if (result != UPNP_E_SUCCESS) {
            VORN_LOG(LOG_ERR, "Error UpnpSearchAsync : %d", result);
        }
        std::this_thread::sleep_for(kAnswerTime);
        if (scanner->StopUpnp() != 0) {
            VORN_LOG(LOG_ERR, "Error: cannot stop upnp");
        }
    }
    scanner->PublishScan();
    searching_ = false;
    return nullptr;
}

int UpnpScanner::StartUpnp() {
    int result = UpnpInit2(nullptr, port_);
    if (result != UPNP_E_SUCCESS) {
        VORN_LOG(LOG_ERR, "Failed to init UPNP, err=%d, port=%d", result, port_);
        return -1;
    }
    result = UpnpRegisterClient(&CallbackEventHandler, this, &handle_);
    if (result != UPNP_E_SUCCESS) {
        VORN_LOG(LOG_ERR, "Error registering as client : %d", result);
        UpnpFinish();
        return -1;
    }
    return 0;
}

int UpnpScanner::StopUpnp() {
    const int result = UpnpUnRegisterClient(handle_);
    // Finished either way: a library left initialised would refuse every later search.
    UpnpFinish();
    if (result != UPNP_E_SUCCESS) {
        VORN_LOG(LOG_ERR, "Error unregistering as client : %d", result);
        return -1;
    }
    return 0;
}

bool UpnpScanner::IsFull() {
    ListLock lock(mutex);
    return root["ClientList"].size() >= kMaxDevices;
}

void UpnpScanner::HandleDiscovery(const std::string& ip, const std::string& location) {
    if (ip.empty() || location.size() > kMaxLocationLength ||
        location.compare(0, 7, "http://") != 0) {
        VORN_LOG(LOG_WARNING, "Skipped upnp answer from [%s]", ip.c_str());
        return;
    }
    if (IsFull()) {
        VORN_LOG(LOG_WARNING, "Skipped upnp answer from [%s]: list full", ip.c_str());
        return;
    }
    char* downloaded = nullptr;
    char contentType[LINE_SIZE];
    const int result = UpnpDownloadUrlItem(location.c_str(), &downloaded, contentType);
    const std::unique_ptr<char, decltype(&std::free)> owner(downloaded, &std::free);
    if (result != UPNP_E_SUCCESS || downloaded == nullptr) {
        return;
    }
    Json::Value device;
    if (!DescribeDevice(std::string(downloaded, strnlen(downloaded, kMaxDescriptionLength + 1)),
                        device)) {
        VORN_LOG(LOG_WARNING, "Skipped upnp description from [%s]", ip.c_str());
        return;
    }
    device["ipAddr"] = ip;
    if (!UpdateKeysByIP(ip, device, true)) {
        VORN_LOG(LOG_ERR, "failed to update key for upnp data");
    }
}

bool UpnpScanner::DescribeDevice(const std::string& description, Json::Value& device) {
    // ixml refuses text after the root element but leaks the node it made of it.
    const std::size_t end = description.find_last_of('>');
    if (description.size() > kMaxDescriptionLength ||
        description.find_first_not_of(" \t\r\n", end == std::string::npos ? 0 : end + 1) !=
            std::string::npos) {
        return false;
    }
    IXML_Document* parsed = nullptr;
    const int result = ixmlParseBufferEx(description.c_str(), &parsed);
    const std::unique_ptr<IXML_Document, decltype(&ixmlDocument_free)> document(parsed,
                                                                                &ixmlDocument_free);
    if (result != IXML_SUCCESS || document == nullptr) {
        return false;
    }
    device = Json::Value(Json::objectValue);
    for (const char* tag : kNameTags) {
        device[tag] = SearchValueByTagName(document.get(), tag);
    }
    return true;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
