#include "network/module/client_index.h"

#include <algorithm>
#include <limits>

namespace vornnetwork {
namespace network {
namespace module {

bool ClientIndex::Find(const Json::Value& list, const std::string& text, Json::ArrayIndex& index) {
    if (!built_) {
        Build(list);
    }
    const auto found = first_.find(text);
    if (found == first_.end() || found->second >= hidingFrom_) {
        return false;
    }
    index = found->second;
    return true;
}

void ClientIndex::Appended(const Json::Value& entry, Json::ArrayIndex position) {
    if (!built_) {
        return;
    }
    if (!entry.isObject() || !entry.isMember(key_)) {
        hidingFrom_ = std::min(hidingFrom_, position);
    } else if (entry[key_].isString()) {
        first_.emplace(entry[key_].asString(), position);
    }
}

bool ClientIndex::Changes(const Json::Value& entry, const Json::Value& obj) const {
    return obj.isMember(key_) && !(entry.isMember(key_) && entry[key_] == obj[key_]);
}

void ClientIndex::Build(const Json::Value& list) {
    first_.clear();
    first_.reserve(list.size());
    hidingFrom_ = std::numeric_limits<Json::ArrayIndex>::max();
    built_ = true;
    for (Json::ArrayIndex i = 0; i < list.size(); ++i) {
        Appended(list[i], i);
    }
}

}  // namespace module
}  // namespace network
}  // namespace vornnetwork
