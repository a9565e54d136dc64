#ifndef VORN_UTILS_CONFIG_H
#define VORN_UTILS_CONFIG_H

#include <map>
#include <string>

namespace vornwireless {
namespace utils {

// A setting file held whole in memory. Values are text; typed setters store bools as "yes"/"no".
class Config {
  public:
    Config() = default;
    explicit Config(const std::string& name) : name_(name) {}
    virtual ~Config() = default;

    virtual int Write() = 0;
    virtual int Read() = 0;

    void SetName(const std::string& name) { name_ = name; }
    std::string GetNameString() const { return name_; }
    const char* GetNameCString() const { return name_.c_str(); }
    // The directory part of the file name, as dirname(3) gives it ("." without a slash).
    std::string GetDirName() const;

  protected:
    // Ensures the file's directory exists (created 0755).
    int MakeDirectory() const;

  private:
    std::string name_;
};

// A file of named sections holding key=value pairs. Written atomically (temporary file + rename).
class ConfigSection : public Config {
  public:
    using Section = std::map<std::string, std::string>;
    using Sections = std::map<std::string, Section>;

    ConfigSection() = default;
    explicit ConfigSection(const std::string& name) : Config(name) {}
    ~ConfigSection() override = default;

    // Merges the file into memory: every section read replaces that section's keys. 0 or -1.
    int Read() override;
    int Write() override;

    bool Find(const std::string& section) const { return sections_.count(section) != 0; }
    bool Empty() const { return sections_.empty(); }
    int DeleteSection(const std::string& section);
    Sections GetKeyValues() const { return sections_; }
    // Creates the section and key (empty) when missing, and a later Write keeps them.
    std::string GetKeyValue(const std::string& section, const std::string& key);

    void AddKeyValue(const std::string& section, const std::string& key, const std::string& value);
    // Without it a string literal would pick the bool overload.
    void AddKeyValue(const std::string& section, const std::string& key, const char* value);
    void AddKeyValue(const std::string& section, const std::string& key, bool value);
    void AddKeyValue(const std::string& section, const std::string& key, double value);
    void AddKeyValue(const std::string& section, const std::string& key, int value);

  private:
    int WriteTemp(std::string& tempPath) const;

    Sections sections_;
};

// A flat key=value file. Written atomically too: the pairs alone, in a fresh file.
class ConfigNoSection : public Config {
  public:
    using Pairs = std::map<std::string, std::string>;

    ConfigNoSection() = default;
    explicit ConfigNoSection(const std::string& name) : Config(name) {}
    ~ConfigNoSection() override = default;

    int Read() override;
    int Write() override;

    Pairs GetKeyValues() const { return pairs_; }
    std::string GetKeyValue(const std::string& key) { return pairs_[key]; }

    void AddKeyValue(const std::string& key, const std::string& value);
    // Without it a string literal would pick the bool overload.
    void AddKeyValue(const std::string& key, const char* value);
    void AddKeyValue(const std::string& key, bool value);
    void AddKeyValue(const std::string& key, double value);
    void AddKeyValue(const std::string& key, int value);

  private:
    Pairs pairs_;
};

}  // namespace utils
}  // namespace vornwireless

#endif
