#include "network/module/clientlist.h"

#include <ctime>
#include <exception>
#include <fstream>
#include <memory>
#include <sstream>

#include "platform/root_path.h"
#include "platform/text_file.h"
#include "utils/log.h"

namespace vornnetwork {
namespace network {
namespace module {
namespace {

constexpr const char* kListKey = "ClientList";
constexpr const char* kMacKey = "macAddr";
constexpr const char* kIpKey = "ipAddr";
constexpr const char* kDisplayNameKey = "displayName";
constexpr const char* kTimeKey = "asso_time";
constexpr const char* const kNameKeys[] = {"friendlyName", "modelDescription", "modelName"};
constexpr const char* kDefaultDisplayName = "General DMA";
// A saved list of a few thousand clients is well below this; anything larger is not ours.
constexpr std::streamoff kMaxListFileSize = 4 * 1024 * 1024;
constexpr int kMaxListDepth = 16;

// A member's value as text; empty for a missing member, an array or an object.
std::string TextOf(const Json::Value& object, const char* key) {
    if (!object.isObject() || !object.isMember(key)) {
        return "";
    }
    const Json::Value& value = object[key];
    return value.isConvertibleTo(Json::stringValue) ? value.asString() : "";
}

bool IsClientListRoot(const Json::Value& value) {
    return value.isObject() && value.isMember(kListKey) && value[kListKey].isArray();
}

bool ParseListFile(std::istream& in, Json::Value& parsed) {
    const std::streamoff size = in.seekg(0, std::ios::end).tellg();
    if (size < 0 || size > kMaxListFileSize || !in.seekg(0, std::ios::beg)) {
        return false;
    }
    std::string text(static_cast<std::size_t>(size), '\0');
    if (!in.read(&text[0], static_cast<std::streamsize>(size))) {
        return false;
    }
    Json::CharReaderBuilder builder;
    builder["allowComments"] = true;
    builder["stackLimit"] = kMaxListDepth;
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    try {
        return reader->parse(text.data(), text.data() + text.size(), &parsed, nullptr) &&
               IsClientListRoot(parsed);
    } catch (const std::exception&) {
        return false;  // the depth limit throws
    }
}

std::string DisplayNameOf(const Json::Value& obj) {
    for (const char* key : kNameKeys) {
        const std::string name = TextOf(obj, key);
        if (!name.empty()) {
            return name;
        }
    }
    return kDefaultDisplayName;
}

}  // namespace

ClientList::ClientList() : byMac_(kMacKey), byIp_(kIpKey) {
    pthread_mutex_init(&mutex, nullptr);
    EraseList();
    finished_ = root;
}

ClientList::~ClientList() {
    pthread_mutex_destroy(&mutex);
}

bool ClientList::UpdateKeysByMac(const std::string& mac, const Json::Value& obj, const bool& add) {
    const std::string time = GetLocalTime();
    ListLock lock(mutex);
    if (mac.empty()) {
        VORN_LOG(LOG_ERR, "Error: UpdateKeys - MAC address is empty");
        return false;
    }
    return Merge(byMac_, mac, obj, add, time);
}

bool ClientList::UpdateKeysByIP(const std::string& ip, const Json::Value& obj, const bool& add) {
    const std::string time = GetLocalTime();
    ListLock lock(mutex);
    if (ip.empty()) {
        VORN_LOG(LOG_ERR, "Error: UpdateKeys - IP address is empty");
        return false;
    }
    return Merge(byIp_, ip, obj, add, time);
}

// Merges obj into the entry whose key holds text, or appends it as a new entry when add is set.
bool ClientList::Merge(ClientIndex& by, const std::string& text, const Json::Value& obj, bool add,
                       const std::string& time) {
    if (!obj.isObject() || obj.empty()) {
        VORN_LOG(LOG_ERR, "Error: UpdateKeys - json object member number (%d)", 0);
        return false;
    }
    Json::Value& list = root[kListKey];
    Json::ArrayIndex index = 0;
    const bool exists = by.Find(list, text, index);
    if (!exists && !add) {
        return true;
    }
    if (exists && (byMac_.Changes(list[index], obj) || byIp_.Changes(list[index], obj))) {
        ForgetIndexes();
    }
    const Json::ArrayIndex position = exists ? index : list.size();
    Json::Value& entry = exists ? list[index] : list.append(Json::Value(Json::objectValue));
    for (Json::Value::const_iterator member = obj.begin(); member != obj.end(); ++member) {
        entry[member.name()] = *member;
    }
    if (!exists) {
        entry[by.Key()] = text;
        byMac_.Appended(entry, position);
        byIp_.Appended(entry, position);
    }
    entry[kDisplayNameKey] = DisplayNameOf(entry);
    entry[kTimeKey] = time;
    return true;
}

void ClientList::ForgetIndexes() {
    byMac_.Forget();
    byIp_.Forget();
}

bool ClientList::VerifyMacIsExist(const std::string& mac, unsigned& index) {
    return byMac_.Find(root[kListKey], mac, index);
}

bool ClientList::VerifyIPIsExist(const std::string& ip, unsigned& index) {
    return byIp_.Find(root[kListKey], ip, index);
}

std::string ClientList::FindMacByIP(const std::string& ip) {
    ListLock lock(mutex);
    unsigned index = 0;
    return VerifyIPIsExist(ip, index) ? TextOf(root[kListKey][index], kMacKey) : "";
}

std::string ClientList::FindKey(const std::string& mac, const std::string& key) {
    ListLock lock(mutex);
    unsigned index = 0;
    return VerifyMacIsExist(mac, index) ? TextOf(root[kListKey][index], key.c_str()) : "";
}

bool ClientList::GetObject(const std::string& mac, Json::Value& out) {
    ListLock lock(mutex);
    unsigned index = 0;
    if (!VerifyMacIsExist(mac, index)) {
        return false;
    }
    out = root[kListKey][index];
    return true;
}

void ClientList::EraseList() {
    ListLock lock(mutex);
    root[kListKey] = Json::Value(Json::arrayValue);
    ForgetIndexes();
}

bool ClientList::EraseObject(const std::string& mac) {
    ListLock lock(mutex);
    Json::Value& list = root[kListKey];
    unsigned index = 0;
    if (list.empty() || !VerifyMacIsExist(mac, index)) {
        return false;
    }
    const Json::ArrayIndex last = list.size() - 1;
    if (index != last) {
        list[index].swap(list[last]);
    }
    list.resize(last);
    ForgetIndexes();
    return true;
}

Json::Value ClientList::GetClientList() {
    ListLock lock(mutex);
    return root;
}

void ClientList::PublishScan() {
    ListLock lock(mutex);
    finished_ = root;
}

Json::Value ClientList::GetFinishedList() {
    ListLock lock(mutex);
    return finished_;
}

bool ClientList::WriteToFile(const std::string& path) {
    ListLock lock(mutex);
    std::ostringstream text;
    Json::StyledStreamWriter("\t").write(text, root);
    if (!vorn::platform::WriteFileAtomically(vorn::platform::RootPath(path), text.str())) {
        VORN_LOG(LOG_ERR, "Error - %s could not open", path.c_str());
        return false;
    }
    return true;
}

bool ClientList::LoadClientList(const std::string& path) {
    std::ifstream in(vorn::platform::RootPath(path), std::ios::binary);
    if (!in.is_open()) {
        VORN_LOG(LOG_ERR, "Error: LoadClientList - %s could not open", path.c_str());
        return false;
    }
    Json::Value parsed;
    if (!ParseListFile(in, parsed)) {
        VORN_LOG(LOG_ERR, "Error: LoadClientList - Json::Reader::parse failed");
        return false;
    }
    ListLock lock(mutex);
    root.swap(parsed);
    ForgetIndexes();
    return true;
}

void ClientList::DetermineDisplayName(const Json::Value& obj, std::string& name) {
    name = DisplayNameOf(obj);
}

std::string ClientList::GetLocalTime() {
    const std::time_t now = std::time(nullptr);
    std::tm local = {};
    char text[64] = {};
    if (localtime_r(&now, &local) == nullptr ||
        std::strftime(text, sizeof(text), "%T %G/%m/%d", &local) == 0) {
        return "";
    }
    return text;
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
