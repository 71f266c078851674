// Renames and removes users and groups in Samba's settings file.
#include "tavo_appliance.h"
#include "tavo_str.h"

#include "core/detail/appliance_paths.h"
#include "core/detail/extras.h"
#include "core/detail/file_rewrite.h"
#include "core/detail/guard.h"
#include "core/detail/keep_fault.h"
#include "core/detail/smb_user_lists.h"

namespace {

std::optional<std::string> Upper(const std::string &name)
{
    const tavo::KeepFault keep;
    std::string upper(3 * name.size() + 1, '\0');
    const int length = TLIBUnicodeUTF8StrUpper(name.c_str(), upper.data(), static_cast<int>(upper.size()));
    if (length < 1)
        return std::nullopt;
    upper.resize(static_cast<size_t>(length) - 1);
    return upper;
}

}  // namespace

extern "C" int TAVOUserModifySmbConf(const TLIBSZHASH *pshNames)
{
    if (!pshNames)
        return Fail(ERR_BAD_PARAMETERS);
    return Guard([&] {
        if (!tavo::LoadExtras())  // a name that could not be compared would stay unchanged
            return Fail(ERR_OPEN_FAILED);
        tavo::FileRewrite file;
        const int open_code = file.Open(tavo::kSambaFile);
        if (file.IsMissing())
            return 0;
        if (open_code != 0)
            return Fail(open_code);
        std::string text;
        if (!file.Read(text))
            return Fail(ERR_READ_FAILED);
        const std::string changed =
            tavo::ChangeSmbUserLists(text, [&](std::string_view name, bool is_group) -> std::optional<std::string> {
                const std::optional<std::string> upper = Upper((is_group ? "@" : "") + std::string(name));
                const char *value = upper ? SzTLIBSzHashGetValue(pshNames, upper->c_str()) : nullptr;
                return value ? std::optional<std::string>(value) : std::nullopt;
            });
        if (changed == text)
            return 0;
        const tavo::Code code = file.Replace(changed);
        return code == 0 ? 0 : Fail(code);
    });
}
