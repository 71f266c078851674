// tavoctl user export: the accounts as a list.
#include "account/account_key.h"
#include "account/account_rows.h"
#include "account/user_columns.h"
#include "account/user_record.h"
#include "account/user_verbs.h"
#include "frame/input_file.h"
#include "frame/program.h"

#include <fstream>
#include <map>
#include <sstream>

namespace tavoctl {
namespace {

// Samba's two hashes of every account that has some.
using SambaHashes = std::map<std::string, std::pair<std::string, std::string>>;

SambaHashes ReadSambaHashes()
{
    SambaHashes found;
    std::ifstream in("/usr/tavo/etc/private/smbpasswd");
    for (std::string line; std::getline(in, line);) {
        std::istringstream fields(line);
        std::string name, uid, lm, nt;
        if (std::getline(fields, name, ':') && std::getline(fields, uid, ':') && std::getline(fields, lm, ':') &&
            std::getline(fields, nt, ':') && lm.find('X') == std::string::npos)
            found[AccountKey(name)] = {lm, nt};
    }
    return found;
}

class UserExport : public Verb {
  public:
    static constexpr VerbInfo info = {"export", reads,
                                      "Writes the accounts of people as comma-separated values, or as JSON, in the "
                                      "form that import reads. Password hashes only when asked for: whoever has them "
                                      "can log in to Samba.",
                                      "tavoctl user export > users.csv\n"
                                      "tavoctl user export --json --hashes --output /root/users.json"};

    void Declare(Arguments &arguments) override
    {
        arguments.Flag("--hashes", hashes_, "with the hashes of the passwords");
        arguments.Option("--output", "PATH", path_, "a new file that only root can read (standard output)");
    }

    int Run(const Call &call) override
    {
        Table table(UserColumns(hashes_ ? WithHashes::yes : WithHashes::no));
        const SambaHashes samba = hashes_ ? ReadSambaHashes() : SambaHashes{};
        for (const std::string &name : UserNames()) {
            const std::optional<User> user = FindUser(name);
            if (!user)
                continue;  // deleted since
            std::vector<Cell> row = {user->name,
                                     user->uid,
                                     user->gid,
                                     user->description,
                                     user->home,
                                     user->shell,
                                     user->mail,
                                     PrivilegeText(user->privilege),
                                     ExpiryCell(user->expires),
                                     user->cannot_change_password};
            if (hashes_) {
                const auto found = samba.find(AccountKey(user->name));
                const bool whole = found != samba.end() && user->password.starts_with('$');
                row.push_back(whole ? Cell(user->password) : Cell());
                row.push_back(whole ? Cell(found->second.first) : Cell());
                row.push_back(whole ? Cell(found->second.second) : Cell());
            }
            table.Add(std::move(row));
        }
        WriteWhole(path_, call.json ? table.Json() + "\n" : table.Csv());
        return exit_done;
    }

  private:
    bool hashes_ = false;
    std::string path_;
};

}  // namespace

void AddUserExport(Family &user)
{
    user.Add<UserExport>();
}

}  // namespace tavoctl
