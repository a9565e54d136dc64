#ifndef VORN_NETWORK_MODULE_CLIENT_INDEX_H
#define VORN_NETWORK_MODULE_CLIENT_INDEX_H

#include <json/json.h>

#include <string>
#include <unordered_map>

namespace vornnetwork {
namespace network {
namespace module {

// Finds a client by one key ("macAddr" or "ipAddr") without walking the list. It answers as the
// walk from the front does: the first entry whose key is that exact text, unless an entry before
// it lacks the key, which hides everything after it. Appends are taken in as they happen; any
// other change to the key's values or to the entries' order calls Forget, and the next lookup
// builds the index again. Not locked: the owning list's lock covers it.
class ClientIndex {
  public:
    explicit ClientIndex(const char* key) : key_(key) {}

    const char* Key() const { return key_; }

    bool Find(const Json::Value& list, const std::string& text, Json::ArrayIndex& index);
    // entry has just been appended at position.
    void Appended(const Json::Value& entry, Json::ArrayIndex position);
    // True when merging obj into entry would change what the index knows of entry.
    bool Changes(const Json::Value& entry, const Json::Value& obj) const;
    void Forget() { built_ = false; }

  private:
    void Build(const Json::Value& list);

    const char* key_;
    bool built_ = false;
    std::unordered_map<std::string, Json::ArrayIndex> first_;
    // The first entry without the key; past any position when every entry has it.
    Json::ArrayIndex hidingFrom_ = 0;
};

}  // namespace module
}  // namespace network
}  // namespace vornnetwork

#endif
