// tavoctl section: settings files with [sections].
#include "families.h"
#include "frame/containers.h"
#include "frame/failure.h"
#include "frame/program.h"
#include "frame/settings_file.h"
#include "frame/table.h"

#include "tavo_section.h"

#include <algorithm>

namespace tavoctl {
namespace {

std::vector<std::string> Sections(SettingsFile &file, const char *path)
{
    StringList names;
    if (TLIBFileEnumSection(path, names.Address()) < 0)
        throw file.Failed("list the sections of " + file.Path());
    return names.Items();
}

bool HasSection(SettingsFile &file, const char *path, const std::string &name)
{
    const std::vector<std::string> names = Sections(file, path);
    return std::find(names.begin(), names.end(), name) != names.end();
}

std::string InFile(const std::string &verb, const std::string &section, SettingsFile &file)
{
    return verb + " section [" + section + "] of " + file.Path();
}

void SetAll(StringHash &settings, const std::vector<std::string> &pairs)
{
    for (const std::string &pair : pairs) {
        const auto [key, value] = PairArgument(pair);
        settings.Set(key, value);
    }
}

constexpr char list_hint[] = "tavoctl section list shows what is there";

class SectionList : public Verb {
  public:
    static constexpr VerbInfo info = {"list", reads, "Lists the sections of a file in its order.",
                                      "tavoctl section list --file /etc/samba/smb.conf"};

    void Declare(Arguments &arguments) override { file_.DeclareAny(arguments, false); }

    int Run(const Call &call) override
    {
        Table table({"section"});
        for (const std::string &name : Sections(file_, file_.Path().c_str()))
            table.Add({name});
        call.Print(table);
        return exit_done;
    }

  private:
    SettingsFile file_;
};

class SectionGet : public Verb {
  public:
    static constexpr VerbInfo info = {"get", reads,
                                      "Lists the settings of a section, sorted by key, or prints the value of one. Of "
                                      "a repeated key the last line counts.",
                                      "tavoctl section get --file /etc/samba/smb.conf global\n"
                                      "tavoctl section get --file /etc/samba/smb.conf global workgroup"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SECTION", section_, "its name, without the brackets");
        arguments.OptionalText("KEY", key_, "one setting of it");
        file_.DeclareAny(arguments, false);
    }

    int Run(const Call &call) override
    {
        const std::string attempted = InFile("get", section_, file_);
        StringHash settings;
        const int count = TLIBFileGetSection(file_.Path().c_str(), section_.c_str(), settings.Address());
        if (count < 0)
            throw file_.Failed(attempted);
        // A section that is missing reads like an empty one.
        if (count == 0 && !HasSection(file_, file_.Path().c_str(), section_))
            throw NotFound(attempted, ERR_SECTION_NOT_FOUND, list_hint);
        if (key_.empty())
            PrintAll(call, settings);
        else
            PrintOne(call, settings);
        return exit_done;
    }

  private:
    static void PrintAll(const Call &call, const StringHash &settings)
    {
        Table table({"key", "value"});
        for (const auto &[key, value] : settings.Pairs())
            table.Add({key, value});
        call.Print(table);
    }

    void PrintOne(const Call &call, const StringHash &settings)
    {
        const char *value = settings.Find(key_);
        if (!value)
            throw NotFound("get " + key_ + " from section [" + section_ + "] of " + file_.Path(), ERR_KEY_NOT_FOUND,
                           "tavoctl section get without a key shows what is there");
        Record record;
        record.Add("file", file_.Path());
        record.Add("section", section_);
        record.Add("key", key_);
        record.Add("value", value);
        call.PrintValue(value, record);
    }

    std::string section_;
    std::string key_;
    SettingsFile file_;
};

class SectionSet : public Verb {
  public:
    static constexpr VerbInfo info = {
        "set", changes | tells_before,
        "Sets keys of a section that is there, and renames it. Its other settings stay, and so do its comment lines, "
        "but "
        "the settings change their order. What could not stay (a line without \"=\") is a reason to refuse.",
        "tavoctl section set --file /etc/samba/smb.conf global workgroup=OFFICE\n"
        "tavoctl section set --file /etc/samba/smb.conf --replace photo path=/volume1/photo\n"
        "tavoctl section set --file /etc/samba/smb.conf --rename pictures photo"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SECTION", section_, "its name, without the brackets");
        arguments.Texts("KEY=VALUE", pairs_, "a setting", 0);
        file_.DeclareAny(arguments, true);
        arguments.Flag("--replace", replace_, "drop the other settings of the section");
        arguments.Option("--rename", "NAME", new_name_, "the section's new name");
    }

    int Run(const Call &call) override
    {
        if (pairs_.empty() && new_name_.empty() && !replace_)
            throw UsageFailure(InFile("set", section_, file_), "no KEY=VALUE was given");
        file_.Change(call, [&](const char *path) { Rewrite(path); });
        return exit_done;
    }

  private:
    void Rewrite(const char *path)
    {
        const std::string attempted = InFile("set", section_, file_);
        // Looked for first: the library rewrites the file also when the section is missing.
        if (!HasSection(file_, path, section_))
            throw NotFound(attempted, ERR_SECTION_NOT_FOUND, "tavoctl section add makes a new one");
        StringHash settings;
        if (!replace_)
            Keep(settings);
        SetAll(settings, pairs_);
        const char *name = new_name_.empty() ? nullptr : new_name_.c_str();
        if (ErrTLIBFileSetSection(path, section_.c_str(), name, settings.Get(), 1, nullptr) != 1)
            throw file_.Failed(attempted);
    }

    // The settings that stand there now. A section is written anew from its pairs, so whatever is no pair would vanish.
    void Keep(StringHash &settings)
    {
        int sections = 0;
        int number = 0;
        bool inside = false;
        for (const std::string &line : file_.Lines()) {
            ++number;
            const int length = static_cast<int>(line.size());
            if (TLIBIFileIsSection(line.c_str(), length) == 1) {
                inside = TLIBIFileMatchSection(line.c_str(), length, section_.c_str()) == 1;
                sections += inside;
                if (sections > 1 && inside)
                    Refuse("it stands there more than once, again in line " + std::to_string(number));
                continue;
            }
            if (!inside || line.starts_with('#') || line.starts_with(';') ||
                line.find_first_not_of(" \t\r") == std::string::npos)
                continue;
            const auto setting = SplitSetting(line);
            if (!setting || line.starts_with('['))
                Refuse("line " + std::to_string(number) + " would be lost: " + line);
            settings.Set(setting->first, setting->second);
        }
    }

    [[noreturn]] void Refuse(const std::string &reason)
    {
        throw Failure{.attempted = InFile("set", section_, file_),
                      .reason = reason,
                      .hint = "mend the file, or give all settings with --replace"};
    }

    std::string section_;
    std::vector<std::string> pairs_;
    SettingsFile file_;
    bool replace_ = false;
    std::string new_name_;
};

class SectionAdd : public Verb {
  public:
    static constexpr VerbInfo info = {
        "add", changes | tells_before, "Appends a new section to a file, which is created when it is missing.",
        "tavoctl section add --file /etc/samba/smb.conf photo path=/volume1/photo ro=guest"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SECTION", section_, "its name, without the brackets");
        arguments.Texts("KEY=VALUE", pairs_, "a setting", 0);
        file_.DeclareAny(arguments, true);
    }

    int Run(const Call &call) override
    {
        file_.Change(call, [&](const char *path) { Append(path); });
        return exit_done;
    }

  private:
    void Append(const char *path)
    {
        const std::string attempted = InFile("add", section_, file_);
        StringList names;
        // A file that cannot be read may be one that is still to be made; if not, the next call says so.
        TLIBFileEnumSection(path, names.Address());
        const std::vector<std::string> present = names.Items();
        if (std::find(present.begin(), present.end(), section_) != present.end())
            throw Failure{.attempted = attempted, .code = ERR_SECTION_EXISTS};
        StringHash settings;
        SetAll(settings, pairs_);
        if (ErrTLIBFileAddSection(path, section_.c_str(), settings.Get(), nullptr) != 0)
            throw LibraryFailure(attempted);
    }

    std::string section_;
    std::vector<std::string> pairs_;
    SettingsFile file_;
};

class SectionRemove : public Verb {
  public:
    static constexpr VerbInfo info = {"remove", changes | tells_before | destroys,
                                      "Removes a section with its settings. Its comment lines stay, and then belong to "
                                      "the section before it.",
                                      "tavoctl section remove --file /etc/samba/smb.conf photo\n"
                                      "tavoctl section remove --yes --file /etc/samba/smb.conf photo"};

    void Declare(Arguments &arguments) override
    {
        arguments.Text("SECTION", section_, "its name, without the brackets");
        file_.DeclareAny(arguments, true);
    }

    int Run(const Call &call) override
    {
        const std::string attempted = InFile("remove", section_, file_);
        if (!HasSection(file_, file_.Path().c_str(), section_))
            throw NotFound(attempted, ERR_SECTION_NOT_FOUND, list_hint);
        call.Confirm("Remove section [" + section_ + "] of " + file_.Path() + "?");
        file_.Change(call, [&](const char *path) {
            if (ErrTLIBFileRemoveSection(path, section_.c_str()) != 1)
                throw file_.Failed(attempted);
        });
        return exit_done;
    }

  private:
    std::string section_;
    SettingsFile file_;
};

}  // namespace

void AddSection(Program &program)
{
    Family &section = program.Add("section", "Settings files with [sections]");
    section.Add<SectionList>();
    section.Add<SectionGet>();
    section.Add<SectionSet>();
    section.Add<SectionAdd>();
    section.Add<SectionRemove>();
}

}  // namespace tavoctl
