// tavoctl conf: settings files, lines of key and value.
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/host.h"
#include "frame/program.h"
#include "frame/settings_file.h"
#include "frame/table.h"

#include "tavo_file.h"

namespace tavoctl {
namespace {

// For completion: the keys of the system settings.
std::vector<std::string> Keys()
{
    StringList lines;
    std::vector<std::string> keys;
    if (TLIBFileReadLines(settings_file, lines.Address()) < 0)
        return keys;
    for (const std::string &line : lines.Items())
        if (const auto setting = SplitSetting(line))
            keys.push_back(setting->first);
    return keys;
}

// The length is asked for first; a value that has grown since then is asked for again.
std::string Value(SettingsFile &file, const std::string &key, bool last)
{
    const char *path = file.Path().c_str();
    std::string value;
    for (;;) {
        const int asked = TLIBFileGetKeyValue(path, key.c_str(), nullptr, 0, last);
        if (asked > 0) {
            value.resize(static_cast<std::size_t>(asked));
            const int length = TLIBFileGetKeyValue(path, key.c_str(), value.data(), asked, last);
            if (length < 0 && TLIBErrGet() == ERR_NOT_ENOUGH_MEMORY)
                continue;
            if (length > 0)
                return value.substr(0, static_cast<std::size_t>(length) - 1);
        }
        throw file.Failed("get " + key + " from " + file.Path());
    }
}

class ConfGet : public Verb {
  public:
    static constexpr VerbInfo info = {"get", reads, "Prints the value of KEY; of a repeated key, the first.",
                                      "tavoctl conf get runsamba\n"
                                      "tavoctl conf get --defaults maxdisks\n"
                                      "tavoctl conf get --file /etc/sysconfig/network HOSTNAME"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("KEY", key_, "the name of the setting", Keys);
        file_.DeclareSystem(arguments, false);
        arguments.Flag("--last", last_, "of a repeated key, the last value");
    }

    int Run(const Call &call) override
    {
        const std::string value = Value(file_, key_, last_);
        Record record;
        record.Add("file", file_.Path());
        record.Add("key", key_);
        record.Add("value", value);
        call.PrintValue(value, record);
        return exit_done;
    }

  private:
    std::string key_;
    SettingsFile file_;
    bool last_ = false;
};

class ConfList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads,
                                      "Lists every setting with the number of its line. A repeated key is listed as "
                                      "often as it stands there; `conf get` takes the first.",
                                      "tavoctl conf list\n"
                                      "tavoctl conf list --defaults --json"};

    void Declare(Arguments &arguments) override { file_.DeclareSystem(arguments, false); }

    int Run(const Call &call) override
    {
        Table table({"line", "key", "value"});
        int number = 0;
        for (const std::string &line : file_.Lines()) {
            ++number;
            if (const auto setting = SplitSetting(line))
                table.Add({number, setting->first, setting->second});
        }
        call.Print(table);
        return exit_done;
    }

  private:
    SettingsFile file_;
};

// A verb that changes the lines of one key.
class KeyChange : public Verb {
  public:
    void Declare(Arguments &arguments) override
    {
        arguments.Text("KEY", key_, "the name of the setting", Keys);
        file_.DeclareSystem(arguments, true);
    }

    int Run(const Call &call) override
    {
        file_.Change(call, [&](const char *path) { Edit(path); });
        return exit_done;
    }

  protected:
    virtual void Edit(const char *path) = 0;

    std::string key_;
    SettingsFile file_;
};

// One that gives it a value.
class ValueChange : public KeyChange {
  protected:
    void DeclareValue(Arguments &arguments, const char *help, Candidates keys)
    {
        arguments.Text("KEY", key_, "the name of the setting", keys);
        arguments.Text("VALUE", value_, help);
        file_.DeclareSystem(arguments, true);
        arguments.Flag("--quote", quote_, "write the value in double quotes");
    }

    const char *Format() const { return quote_ ? "%s=\"%s\"\n" : nullptr; }

    std::string value_;

  private:
    bool quote_ = false;
};

class ConfSet : public ValueChange {
  public:
    static constexpr VerbInfo info = {"set", changes | tells_before,
                                      "Sets KEY to VALUE. Its first line is replaced, later ones of the same key are "
                                      "dropped, and a key that is not there is appended; comments and order stay.",
                                      "tavoctl conf set runsamba yes\n"
                                      "tavoctl conf set --dry-run runsamba yes\n"
                                      "tavoctl conf set --file /etc/sysconfig/network --quote HOSTNAME nas\n"
                                      "tavoctl conf set offset -- -5"};

    void Declare(Arguments &arguments) override { DeclareValue(arguments, "its new value", Keys); }

  private:
    void Edit(const char *path) override
    {
        if (TLIBFileSetKeyValue(path, key_.c_str(), value_.c_str(), Format()) != 1)
            throw LibraryFailure("set " + key_ + " in " + file_.Path());
    }
};

class ConfAppend : public ValueChange {
  public:
    static constexpr VerbInfo info = {"append", changes | tells_before,
                                      "Appends KEY with VALUE. Fails when the key is there already.",
                                      "tavoctl conf append userHomeEnable yes"};

    void Declare(Arguments &arguments) override { DeclareValue(arguments, "its value", nullptr); }

  private:
    void Edit(const char *path) override
    {
        if (TLIBFileAppendKey(path, key_.c_str(), value_.c_str(), Format()) != 1)
            throw LibraryFailure("append " + key_ + " to " + file_.Path());
    }
};

class ConfRemove : public KeyChange {
  public:
    static constexpr VerbInfo info = {"remove", changes | tells_before, "Removes every line of KEY.",
                                      "tavoctl conf remove userHomeEnable\n"
                                      "tavoctl conf remove --dry-run userHomeEnable"};

  private:
    void Edit(const char *path) override
    {
        if (TLIBFileRemoveKey(path, key_.c_str()) != 1)
            throw file_.Failed("remove " + key_ + " from " + file_.Path());
    }
};

class ConfComment : public KeyChange {
  public:
    static constexpr VerbInfo info = {"comment", changes | tells_before,
                                      "Turns every line of KEY into a comment, with \";\" in front.",
                                      "tavoctl conf comment userHomeEnable"};

  private:
    void Edit(const char *path) override
    {
        if (TLIBFileComment(path, key_.c_str()) != 1)
            throw file_.Failed("comment out " + key_ + " in " + file_.Path());
    }
};

}  // namespace

void AddConf(Program &program)
{
    Family &conf = program.Add("conf", "Settings files: lines of key and value");
    conf.Add<ConfGet>();
    conf.Add<ConfSet>();
    conf.Add<ConfList>();
    conf.Add<ConfRemove>();
    conf.Add<ConfAppend>();
    conf.Add<ConfComment>();
}

}  // namespace tavoctl
