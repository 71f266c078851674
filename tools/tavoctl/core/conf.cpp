// tavoctl conf: settings files, lines of key and value.
#include "tavo_file.h"

#include "families.h"
#include "frame/settings_file.h"
#include "frame/text.h"

namespace tavoctl {
namespace {

struct ConfLine {
    int line;
    std::string key;
    std::string value;
};

constexpr Column<ConfLine> conf_lines[] = {
    {"line", field<&ConfLine::line>, "number in the file, from 1"},
    {"key", field<&ConfLine::key>},
    {"value", field<&ConfLine::value>},
};

struct ConfValue {
    std::string file;
    std::string key;
    std::string value;
};

constexpr Column<ConfValue> conf_value[] = {
    {"file", field<&ConfValue::file>},
    {"key", field<&ConfValue::key>},
    {"value", field<&ConfValue::value>},
};

constexpr ArgumentKind conf_key = {
    .name = "setting", .candidates = [] { return SettingsFile().Keys(); }, .sample = "no_such_key"};

Failure ConfFailure(const SettingsFile &file, const std::string &attempted, const std::string &key)
{
    const bool misspelt = TLIBErrGet() == ERR_KEY_NOT_FOUND;
    Failure failure = file.Failed(attempted);
    if (misspelt)
        failure.hint = DidYouMean(key, file.Keys(), "");
    return failure;
}

// The length is asked for first; a value that has grown since then is asked for again.
std::string ReadValue(const SettingsFile &file, const std::string &key, bool last)
{
    const std::string path = file.Path();
    std::string value;
    for (;;) {
        const int asked = TLIBFileGetKeyValue(path.c_str(), key.c_str(), nullptr, 0, last);
        if (asked > 0) {
            value.resize(static_cast<std::size_t>(asked));
            const int length = TLIBFileGetKeyValue(path.c_str(), key.c_str(), value.data(), asked, last);
            if (length < 0 && TLIBErrGet() == ERR_NOT_ENOUGH_MEMORY)
                continue;
            if (length > 0)
                return value.substr(0, static_cast<std::size_t>(length) - 1);
        }
        throw ConfFailure(file, "get " + key + " from " + path, key);
    }
}

Action ConfGet(Arguments &in)
{
    const auto key = in.Text("KEY", conf_key, "the name of the setting");
    const auto file = SettingsFile::OfSystem(in, reads);
    const auto last = in.Flag("--last", "of a repeated key, the last value");
    return [=](Call &call) {
        const ConfValue setting = {file.Path(), *key, ReadValue(file, *key, *last)};
        call.Value(setting.value, conf_value, setting);
    };
}

Action ConfList(Arguments &in)
{
    const auto file = SettingsFile::OfSystem(in, reads);
    return [=](Call &call) {
        std::vector<ConfLine> lines;
        int number = 0;
        for (const std::string &line : file.Lines()) {
            ++number;
            if (const auto setting = SplitSetting(line))
                lines.push_back({number, setting->first, setting->second});
        }
        call.List(conf_lines, lines);
    };
}

// set and append differ in the library's function and in what they say.
Action GiveValue(Arguments &in, decltype(TLIBFileAppendKey) change, const char *verb)
{
    const auto key = in.Text("KEY", conf_key, "the name of the setting");
    const auto value = in.Text("VALUE", any_text, "its new value");
    const auto file = SettingsFile::OfSystem(in, changes);
    const auto quote = in.Flag("--quote", "write the value in double quotes, as in a file in which all are");
    return [=](Call &call) {
        const char *format = *quote ? quoted_setting : file.LineFormat();
        file.Change(call, [&](const char *path) {
            Must(change(path, key->c_str(), value->c_str(), format) == 1,
                 std::string(verb) + " " + *key + " in " + file.Path());
        });
    };
}

// remove and comment: both change all lines of a key.
Action TakeAway(Arguments &in, decltype(TLIBFileRemoveKey) change, const char *verb)
{
    const auto key = in.Text("KEY", conf_key, "the name of the setting");
    const auto file = SettingsFile::OfSystem(in, changes);
    return [=](Call &call) {
        file.Change(call, [&](const char *path) {
            if (change(path, key->c_str()) != 1)
                throw ConfFailure(file, std::string(verb) + " " + *key + " in " + file.Path(), *key);
        });
    };
}

}  // namespace

void AddConf(Program &program)
{
    constexpr unsigned changes_file = changes | by_anybody;
    Family &conf = program.Add("conf", "Settings files: lines of key and value");
    conf.Add("get", reads, Answer::One(conf_value), ConfGet, R"(Prints the value of KEY; of a repeated key, the first.

tavoctl conf get runsamba
tavoctl conf get --defaults maxdisks
tavoctl conf get --file /etc/sysconfig/network HOSTNAME)");
    conf.Add(
        "set", changes_file, [](Arguments &in) { return GiveValue(in, TLIBFileSetKeyValue, "set"); },
        R"(Sets KEY to VALUE. Its first line is replaced, later ones of the
same key are dropped, and a key that is not there is appended; comments and order stay.

tavoctl conf set runsamba yes
tavoctl conf set --dry-run runsamba yes
tavoctl conf set --file /etc/sysconfig/network --quote HOSTNAME nas
tavoctl conf set offset -- -5)");
    conf.Add("list", reads, Answer::List(conf_lines), ConfList,
             R"(Lists every setting with the number of its line. A repeated key
is listed as often as the file has it; `conf get` takes the first.

tavoctl conf list
tavoctl conf list --defaults --json)");
    conf.Add(
        "remove", changes_file, [](Arguments &in) { return TakeAway(in, TLIBFileRemoveKey, "remove"); },
        R"(Removes every line of KEY.

tavoctl conf remove userHomeEnable
tavoctl conf remove --dry-run userHomeEnable)");
    conf.Add(
        "append", changes_file, [](Arguments &in) { return GiveValue(in, TLIBFileAppendKey, "append"); },
        R"(Appends KEY with VALUE. Fails when the key is there already.

tavoctl conf append userHomeEnable yes)");
    conf.Add(
        "comment", changes_file, [](Arguments &in) { return TakeAway(in, TLIBFileComment, "comment out"); },
        R"(Turns every line of KEY into a comment, with ";" in front.

tavoctl conf comment userHomeEnable)");
}

}  // namespace tavoctl
