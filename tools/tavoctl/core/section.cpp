// tavoctl section: settings files with [sections].
#include "tavo_section.h"

#include "families.h"
#include "frame/containers.h"
#include "frame/settings_file.h"
#include "frame/text.h"

namespace tavoctl {
namespace {

struct SectionName {
    std::string section;
};

constexpr Column<SectionName> section_names[] = {{"section", field<&SectionName::section>}};

using SectionPair = std::pair<std::string, std::string>;

constexpr Column<SectionPair> section_pairs[] = {
    {"key", field<&SectionPair::first>},
    {"value", field<&SectionPair::second>},
};

struct SectionValue {
    std::string file, section, key, value;
};

constexpr Column<SectionValue> section_value[] = {
    {"file", field<&SectionValue::file>},
    {"section", field<&SectionValue::section>},
    {"key", field<&SectionValue::key>},
    {"value", field<&SectionValue::value>},
};

constexpr ArgumentKind section_kind = {.name = "section", .sample = "no-such-section"};
constexpr char section_help[] = "its name, without the brackets";

std::vector<std::string> Sections(const SettingsFile &file, const char *path)
{
    StringList names;
    if (TLIBFileEnumSection(path, names.Address()) < 0)
        throw file.Failed("list the sections of " + file.Path());
    return names.Items();
}

std::string InFile(const std::string &verb, const std::string &section, const SettingsFile &file)
{
    return verb + " section [" + section + "] of " + file.Path();
}

void RequireSection(const SettingsFile &file, const char *path, const std::string &section,
                    const std::string &attempted)
{
    const std::vector<std::string> names = Sections(file, path);
    if (!Contains(names, section))
        throw NotFound(attempted, ERR_SECTION_NOT_FOUND,
                       DidYouMean(section, names, "tavoctl section list shows what is there"));
}

void SetAll(StringHash &settings, const std::vector<std::string> &pairs)
{
    for (const std::string &pair : pairs) {
        const auto [key, value] = SplitPair(pair);
        settings.Set(key, value);
    }
}

Action SectionList(Arguments &in)
{
    const auto file = SettingsFile::Any(in, reads);
    return [=](Call &call) {
        call.List(section_names, Mapped(Sections(file, file.Path().c_str()),
                                        [](const std::string &name) { return SectionName{name}; }));
    };
}

Action SectionGet(Arguments &in)
{
    const auto section = in.Text("SECTION", section_kind, section_help);
    const auto key = in.OptionalText("KEY", any_text, "one setting of it");
    const auto file = SettingsFile::Any(in, reads);
    return [=](Call &call) {
        const std::string path = file.Path();
        const std::string attempted = InFile("get", *section, file);
        StringHash settings;
        const int count = TLIBFileGetSection(path.c_str(), section->c_str(), settings.Address());
        if (count < 0)
            throw file.Failed(attempted);
        // A section that is missing reads like an empty one.
        if (count == 0)
            RequireSection(file, path.c_str(), *section, attempted);
        if (!*key)
            return call.List(section_pairs, settings.Pairs());
        const char *value = settings.Find(**key);
        if (!value)
            throw NotFound("get " + **key + " from section [" + *section + "] of " + path, ERR_KEY_NOT_FOUND,
                           "tavoctl section get without a key shows what is there");
        call.Value(value, section_value, SectionValue{path, *section, **key, value});
    };
}

// The present settings of a section. The library rewrites a section from its pairs, so any other line would vanish.
void KeepSettings(const SettingsFile &file, const std::string &section, StringHash &settings)
{
    const auto refuse = [&](const std::string &reason) {
        throw Failure{.attempted = InFile("set", section, file),
                      .reason = reason,
                      .hint = "mend the file, or give all settings with --replace"};
    };
    int sections = 0;
    int number = 0;
    bool inside = false;
    for (const std::string &line : file.Lines()) {
        ++number;
        const int length = static_cast<int>(line.size());
        if (TLIBIFileIsSection(line.c_str(), length) == 1) {
            inside = TLIBIFileMatchSection(line.c_str(), length, section.c_str()) == 1;
            sections += inside;
            if (sections > 1 && inside)
                refuse("duplicate section, again in line " + std::to_string(number));
            continue;
        }
        if (!inside || line.starts_with('#') || line.starts_with(';') ||
            line.find_first_not_of(" \t\r") == std::string::npos)
            continue;
        const auto setting = SplitSetting(line);
        if (!setting || line.starts_with('['))
            refuse("line " + std::to_string(number) + " would be lost: " + line);
        settings.Set(setting->first, setting->second);
    }
}

Action SectionSet(Arguments &in)
{
    const auto section = in.Text("SECTION", section_kind, section_help);
    const auto pairs = in.Texts("KEY=VALUE", setting_pair, "a setting", 0);
    const auto file = SettingsFile::Any(in, changes);
    const auto replace = in.Flag("--replace", "drop the other settings of the section");
    const auto new_name = in.Option("--rename", "NAME", any_text, "the section's new name");
    return [=](Call &call) {
        const std::string attempted = InFile("set", *section, file);
        RefuseIf(pairs->empty() && !*new_name && !*replace, attempted, "no KEY=VALUE was given");
        file.Change(call, [&](const char *path) {
            // Check first: the library rewrites the file even if the section is missing.
            RequireSection(file, path, *section, attempted);
            StringHash settings;
            if (!*replace)
                KeepSettings(file, *section, settings);
            SetAll(settings, *pairs);
            const char *name = *new_name ? (*new_name)->c_str() : nullptr;
            if (ErrTLIBFileSetSection(path, section->c_str(), name, settings.Get(), 1, nullptr) != 1)
                throw file.Failed(attempted);
        });
    };
}

Action SectionAdd(Arguments &in)
{
    const auto section = in.Text("SECTION", section_kind, section_help);
    const auto pairs = in.Texts("KEY=VALUE", setting_pair, "a setting", 0);
    const auto file = SettingsFile::Any(in, changes);
    return [=](Call &call) {
        const std::string attempted = InFile("add", *section, file);
        file.Change(call, [&](const char *path) {
            StringList names;
            // An unreadable file may be a missing one, which the next call creates; if not, that call fails.
            TLIBFileEnumSection(path, names.Address());
            if (Contains(names.Items(), *section))
                throw Failure{.attempted = attempted, .code = ERR_SECTION_EXISTS};
            StringHash settings;
            SetAll(settings, *pairs);
            Must(ErrTLIBFileAddSection(path, section->c_str(), settings.Get(), nullptr) == 0, attempted);
        });
    };
}

Action SectionRemove(Arguments &in)
{
    const auto section = in.Text("SECTION", section_kind, section_help);
    const auto file = SettingsFile::Any(in, changes);
    return [=](Call &call) {
        const std::string attempted = InFile("remove", *section, file);
        RequireSection(file, file.Path().c_str(), *section, attempted);
        const auto remove = [&](const char *path) {
            if (ErrTLIBFileRemoveSection(path, section->c_str()) != 1)
                throw file.Failed(attempted);
        };
        file.Change(call, remove, "Remove section [" + *section + "] of " + file.Path() + "?");
    };
}

}  // namespace

void AddSection(Program &program)
{
    constexpr unsigned changes_file = changes | by_anybody;
    Family &section = program.Add("section", "Settings files with [sections]");
    section.Add("list", reads, Answer::List(section_names), SectionList, R"(Lists the sections of a file in its order.

tavoctl section list --file /etc/samba/smb.conf)");
    section.Add("get", reads, Answer::List(section_pairs).OrOne(section_value), SectionGet,
                R"(Lists the settings of a section,
sorted by key, or prints the value of one. Of a repeated key the last line counts.

tavoctl section get --file /etc/samba/smb.conf global
tavoctl section get --file /etc/samba/smb.conf global workgroup)");
    section.Add("set", changes_file, SectionSet, R"(Sets keys of a section that is there, and renames it. Its
other settings stay, and so do its comment lines, but the settings change their order. A line that could not stay (one
without "=") is a reason to refuse.

tavoctl section set --file /etc/samba/smb.conf global workgroup=OFFICE
tavoctl section set --file /etc/samba/smb.conf --replace photo path=/volume1/photo
tavoctl section set --file /etc/samba/smb.conf --rename pictures photo)");
    section.Add("add", changes_file, SectionAdd, R"(Appends a new section to a file, which is created when it is
missing.

tavoctl section add --file /etc/samba/smb.conf photo path=/volume1/photo ro=guest)");
    section.Add("remove", changes_file | destroys, SectionRemove, R"(Removes a section with its settings. Its comment
lines stay, and then belong to the section before it.

tavoctl section remove --file /etc/samba/smb.conf photo
tavoctl section remove --yes --file /etc/samba/smb.conf photo)");
}

}  // namespace tavoctl
