// The shared parts of the verbs of users and of groups. A Kind has the differences: its record, columns and functions.
#ifndef TAVOCTL_ACCOUNT_VERBS_H
#define TAVOCTL_ACCOUNT_VERBS_H

#include "account/account_rows.h"
#include "account/account_rules.h"
#include "frame/files.h"
#include "frame/text.h"
#include "frame/verb.h"

#include <set>

namespace tavoctl {

template <class Kind>
Action AccountList(Arguments &in)
{
    const auto prefix = in.Option("--prefix", "TEXT", any_text, "only names that begin so, in any case");
    const auto part = in.Option("--part", "TEXT", any_text, "only names that hold this, in any case");
    return [=](Call &call) {
        RefuseIf(*prefix && *part, std::string("list the ") + Kind::noun + "s",
                 "--prefix and --part exclude each other");
        call.List(Kind::columns, Kind::All(prefix->value_or(""), part->value_or("")));
    };
}

// Renames the account or group; the library changes whatever depends on the name.
template <class Kind>
Action AccountRename(Arguments &in)
{
    const auto name = in.Text("NAME", Kind::kind, Kind::name_help);
    const auto new_name = in.Text("NEW_NAME", Kind::new_kind, "its new name");
    const auto system = in.Flag("--system", std::string("also a ") + Kind::noun + " that the system needs");
    return [=](Call &call) {
        const std::string attempted = std::string("rename the ") + Kind::noun + " " + *name + " to " + *new_name;
        const auto before = Kind::Read(*name);
        RefuseIf(Kind::IsSystem(before) && !*system && Kind::guards_names, attempted, "the system needs it",
                 "--system does it anyway");
        auto after = before;
        after.name = *new_name;
        call.Change(std::string(Kind::noun) + " " + before.name, "name", before.name, after.name);
        if (!call.Proceed())
            return;
        Kind::Set(*name, after, attempted);
        WarnOfName(*new_name);
    };
}

template <class Kind>
Action AccountDelete(Arguments &in)
{
    const auto names = in.Texts("NAME", Kind::kind, Kind::name_help);
    const auto system = in.Flag("--system", std::string("also a ") + Kind::noun + " that the system needs");
    const auto force = in.Flag("--force", Kind::force_help);
    return [=](Call &call) {
        std::vector<std::string> doomed;
        for (const std::string &name : *names) {
            const auto record = Kind::Read(name);
            const std::string attempted = std::string("delete the ") + Kind::noun + " " + name;
            RefuseIf(Kind::IsSystem(record) && !*system, attempted, "the system needs it", "--system does it anyway");
            Kind::RefuseDelete(record, attempted);
            if (!*force)
                Kind::RefuseUsed(record, attempted);
            doomed.push_back(record.name);
            const std::string object = std::string(Kind::noun) + " " + record.name;
            call.BeginEntry(object);
            call.Compare(object, Kind::columns, std::optional(record), std::optional<typename Kind::Record>());
        }
        if (!call.Proceed("Delete " + Joined(doomed, ", ") + Kind::delete_warning + "?"))
            return;
        const auto is_there = [](const std::string &name) { return Kind::Find(name).has_value(); };
        for (const auto &[name, failure] : DeleteAll(doomed, Kind::remove, is_there, Kind::noun))
            call.FailEntry(std::string(Kind::noun) + " " + name, failure);
    };
}

// The checks of both imports for a row of a list, before anything is changed.
template <class Kind>
class ImportedRows {
  public:
    ImportedRows(std::string path, bool update) : path_(std::move(path)), update_(update) {}

    std::string Attempted(const AccountRow &row) const
    {
        return "import " + path_ + ", " + row.Where() + ", " + *row.Find("name");
    }

    // The present account of the row; nothing for a new one.
    std::optional<typename Kind::Record> Present(const AccountRow &row)
    {
        const std::string name = *row.Find("name");
        if (!Kind::new_kind.valid(name))
            throw Failure{.attempted = Attempted(row),
                          .reason = std::string("allowed: ") + Kind::new_kind.allowed,
                          .code = Kind::new_kind.code};
        RefuseIf(!names_.insert(AccountKey(name)).second, Attempted(row), "duplicate name");
        const auto old = Kind::Find(name);
        if (old && !update_)
            throw Failure{.attempted = Attempted(row), .hint = "--update changes it", .code = Kind::exists_code};
        return old;
    }

    // The id that the row gives; nothing where it gives none.
    static std::optional<int> IdIn(const AccountRow &row, const std::string &column)
    {
        const std::string *text = row.Find(column);
        if (!text || text->empty())
            return {};
        const auto id = NumberIn<int>(*text);
        RefuseIf(!id || *id < 0, "read the list", row.Where() + ": " + column + " " + *text + " is not an id");
        return id;
    }

    // Throws a Failure for an id that another account or row has.
    void TakeId(const AccountRow &row, int id)
    {
        Kind::RefuseId(*row.Find("name"), id);
        RefuseIf(!ids_.insert(id).second, Attempted(row),
                 std::string("duplicate ") + Kind::noun + " id " + std::to_string(id));
    }

  private:
    std::string path_;
    bool update_;
    std::set<std::string> names_;
    std::set<int> ids_;
};

// Prints the table as JSON, or else as comma-separated values, to standard output or into a new file.
void Export(const Call &call, const Table &table, const std::optional<std::string> &path);

}  // namespace tavoctl

#endif
