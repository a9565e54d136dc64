#include "platform/qlibc_container.h"

#include <algorithm>
#include <new>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "platform/qlibc_error.h"

struct QLIBSZHASH {
    std::vector<std::pair<std::string, std::string>> entries;
    std::unordered_map<std::string, size_t> index;
};

struct QLIBSZLIST {
    std::vector<std::string> items;
};

namespace {

int Fail(int code) {
    QLIBCErrSet(code);
    return -1;
}

// capacity is a hint; reserving more than a page's worth up front only wastes memory.
template <typename T, typename Items>
T* Allocate(int capacity, Items T::*items) {
    try {
        T* container = new T();
        constexpr size_t kPageWorth = 4096 / sizeof(typename Items::value_type);
        if (capacity > 0) {
            (container->*items).reserve(std::min(static_cast<size_t>(capacity), kPageWorth));
        }
        return container;
    } catch (const std::bad_alloc&) {
        QLIBCErrSet(QLIBC_ERR_NO_MEMORY);
        return nullptr;
    }
}

}  // namespace

extern "C" {

QLIBSZHASH* QLIBCSzHashAlloc(int capacity) {
    return Allocate(capacity, &QLIBSZHASH::entries);
}

void QLIBCSzHashFree(QLIBSZHASH* hash) {
    delete hash;
}

int QLIBCSzHashSetValue(QLIBSZHASH* hash, const char* key, const char* value) {
    if (hash == nullptr || key == nullptr || value == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        auto found = hash->index.find(key);
        if (found != hash->index.end()) {
            hash->entries[found->second].second = value;
        } else {
            hash->entries.emplace_back(key, value);
            hash->index.emplace(key, hash->entries.size() - 1);
        }
        return 0;
    } catch (const std::bad_alloc&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

const char* QLIBCSzHashGetValue(const QLIBSZHASH* hash, const char* key) {
    if (hash == nullptr || key == nullptr) {
        return nullptr;
    }
    auto found = hash->index.find(key);
    return found == hash->index.end() ? nullptr : hash->entries[found->second].second.c_str();
}

int QLIBCSzHashRemove(QLIBSZHASH* hash, const char* key) {
    if (hash == nullptr || key == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    auto found = hash->index.find(key);
    if (found == hash->index.end()) {
        return Fail(QLIBC_ERR_NOT_FOUND);
    }
    const size_t removed = found->second;
    hash->entries.erase(hash->entries.begin() + static_cast<std::ptrdiff_t>(removed));
    hash->index.erase(found);
    for (auto& entry : hash->index) {
        if (entry.second > removed) {
            --entry.second;
        }
    }
    return 0;
}

void QLIBCHashRemoveAll(QLIBSZHASH* hash) {
    if (hash != nullptr) {
        hash->entries.clear();
        hash->index.clear();
    }
}

int QLIBCSzHashCount(const QLIBSZHASH* hash) {
    return hash == nullptr ? 0 : static_cast<int>(hash->entries.size());
}

const char* QLIBCSzHashKeyAt(const QLIBSZHASH* hash, int index) {
    if (hash == nullptr || index < 0 || static_cast<size_t>(index) >= hash->entries.size()) {
        return nullptr;
    }
    return hash->entries[static_cast<size_t>(index)].first.c_str();
}

const char* QLIBCSzHashValueAt(const QLIBSZHASH* hash, int index) {
    if (hash == nullptr || index < 0 || static_cast<size_t>(index) >= hash->entries.size()) {
        return nullptr;
    }
    return hash->entries[static_cast<size_t>(index)].second.c_str();
}

QLIBSZLIST* QLIBCSzListAlloc(int capacity) {
    return Allocate(capacity, &QLIBSZLIST::items);
}

void QLIBCSzListFree(QLIBSZLIST* list) {
    delete list;
}

int QLIBCSzListAdd(QLIBSZLIST* list, const char* value) {
    if (list == nullptr || value == nullptr) {
        return Fail(QLIBC_ERR_INVALID_ARG);
    }
    try {
        list->items.emplace_back(value);
        return 0;
    } catch (const std::bad_alloc&) {
        return Fail(QLIBC_ERR_NO_MEMORY);
    }
}

const char* QLIBCSzListGet(const QLIBSZLIST* list, int index) {
    if (list == nullptr || index < 0 || static_cast<size_t>(index) >= list->items.size()) {
        return nullptr;
    }
    return list->items[static_cast<size_t>(index)].c_str();
}

int QLIBCSzListCount(const QLIBSZLIST* list) {
    return list == nullptr ? 0 : static_cast<int>(list->items.size());
}

void QLIBCSzListRemoveAll(QLIBSZLIST* list) {
    if (list != nullptr) {
        list->items.clear();
    }
}

}  // extern "C"
