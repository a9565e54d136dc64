#include "utils/dbus_client.h"

#include <json/json.h>

#include "dbus/net_client.h"
#include "utils/log.h"

namespace vornwireless {
namespace utils {
namespace {

using vornnetwork::dbus::NetClient;

Json::Value Announcement(const std::string& ifname, const std::string& type) {
    Json::Value info(Json::objectValue);
    info["type"] = type;
    info["ifname"] = ifname;
    return info;
}

// The answer's "priority"; a missing one counts as 0, one that is not an integer as a failure.
bool ReadPriority(const Json::Value& answer, int& priority) {
    if (!answer.isObject() || !answer.isMember("priority")) {
        priority = 0;
        return answer.isObject();
    }
    const Json::Value& value = answer["priority"];
    if (!value.isInt()) {
        return false;
    }
    priority = value.asInt();
    return true;
}

}  // namespace

bool SetGatewayInfo(const std::string& ifname, const std::string& type, const std::string& gateway,
                    const std::string& dns, const std::string& gwClass, int priority,
                    bool refresh) {
    Json::Value info = Announcement(ifname, type);
    info["priority"] = priority;
    info["gateway"] = gateway;
    info["dns"] = dns;
    info["class"] = gwClass;
    info["refresh"] = refresh;
    NetClient client;
    if (client.AddGatewayData(info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to AddGatewayData on [%s]", ifname.c_str());
        return false;
    }
    return true;
}

bool DelGatewayInfo(const std::string& ifname, const std::string& type, bool refresh) {
    Json::Value info = Announcement(ifname, type);
    info["refresh"] = refresh;
    NetClient client;
    if (client.DelGatewayData(info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to DelGatewayData on [%s]", ifname.c_str());
        return false;
    }
    return true;
}

int GetGatewayPriority(const std::string& ifname, const std::string& type) {
    Json::Value info = Announcement(ifname, type);
    Json::Value answer;
    int priority = 0;
    NetClient client;
    if (client.GetGatewayDataByInterface(info, answer) != 0 || !ReadPriority(answer, priority)) {
        VORN_LOG(LOG_ERR, "Failed to GetGatewayDataByInterface [%s]", ifname.c_str());
        return -1;
    }
    return priority;
}

bool RefreshGateway(const std::string& type) {
    Json::Value info(Json::objectValue);
    info["type"] = type;
    NetClient client;
    if (client.RefreshGateway(info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to refresh gateway of type [%s]", type.c_str());
        return false;
    }
    return true;
}

bool SetSlaveGatewayInfo(const std::string& ifname, const std::string& type, bool slave) {
    Json::Value info = Announcement(ifname, type);
    info["slave"] = slave;
    NetClient client;
    if (client.SetSlaveData(info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to SetSlaveData on [%s]", ifname.c_str());
        return false;
    }
    return true;
}

bool CopyGatewayInfo(const std::string& type, const std::string& source,
                     const std::string& destination, bool deleteSource) {
    Json::Value info(Json::objectValue);
    info["type"] = type;
    info["interface_source"] = source;
    info["interface_destination"] = destination;
    info["interface_source_delete"] = deleteSource;
    NetClient client;
    if (client.CopyGatewayData(info) != 0) {
        VORN_LOG(LOG_ERR, "Failed to CopyGatewayData from [%s] to [%s]", source.c_str(),
                 destination.c_str());
        return false;
    }
    return true;
}

}  // namespace utils
}  // namespace vornwireless
