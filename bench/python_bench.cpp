// What a call costs from Python: through the module, under its C name, and by hand through ctypes, against the call from C.
// Changes the accounts of the root that it runs in.
#include "tavo_file.h"
#include "tavo_str.h"
#include "tavo_user.h"

#include "compare.h"

#include <Python.h>

#include <cstdio>
#include <cstdlib>

namespace {

constexpr int kUsers = 200;
constexpr char settings_file[] = "/tmp/python_bench.conf";

// Each function does the same as its neighbour of that name in C below.
constexpr char program[] = R"(
import ctypes
import pwd
import sys
sys.path.insert(0, MODULES)
from tavosdk import settings, text, users

library = ctypes.CDLL("libtavosdk.so.1")
library.BlTLIBIsUserName.argtypes = [ctypes.c_char_p]
library.TLIBUnicodeUTF8StrCaseCmp.argtypes = [ctypes.c_char_p, ctypes.c_char_p]
library.TLIBFileGetKeyValue.argtypes = [ctypes.c_char_p, ctypes.c_char_p, ctypes.c_char_p, ctypes.c_int, ctypes.c_int]

def check_name(is_name, name="anna"):
    return sum(is_name(name) for _ in range(1000))

def compare_texts(compare, left="anna", right="Bert"):
    return -sum(compare(left, right) for _ in range(1000))

check_name_module = lambda: check_name(users.is_name)
check_name_c_name = lambda: check_name(users.BlTLIBIsUserName)
check_name_ctypes = lambda: check_name(library.BlTLIBIsUserName, b"anna")
compare_texts_module = lambda: compare_texts(text.compare)
compare_texts_c_name = lambda: compare_texts(text.TLIBUnicodeUTF8StrCaseCmp)
compare_texts_ctypes = lambda: compare_texts(library.TLIBUnicodeUTF8StrCaseCmp, b"anna", b"Bert")

def read_setting_module():
    return sum(len(settings.get(FILE, "key50")) for _ in range(100))

def read_setting_ctypes():
    buffer = ctypes.create_string_buffer(256)
    name = FILE.encode()
    length = 0
    for _ in range(100):
        library.TLIBFileGetKeyValue(name, b"key50", buffer, 256, 0)
        length += len(buffer.value.decode())
    return length

get_user_module = lambda: sum(users.get("user100").uid for _ in range(100))
get_user_pwd = lambda: sum(pwd.getpwnam("user100").pw_uid for _ in range(100))
list_users_module = lambda: len(users.names())
)";

// A function of the program as a piece of work.
class Script {
  public:
    Script()
    {
        Py_DontWriteBytecodeFlag = 1;
        Py_InitializeEx(0);
        globals_ = PyModule_GetDict(PyImport_AddModule("__main__"));
        SetText("MODULES", BENCH_MODULES);
        SetText("FILE", settings_file);
        Check(PyRun_String(program, Py_file_input, globals_, globals_));
    }

    std::function<uint64_t()> Function(const char *name) const
    {
        PyObject *function = Check(PyDict_GetItemString(globals_, name));
        return [function] {
            PyObject *result = Check(PyObject_CallNoArgs(function));
            const uint64_t number = PyLong_AsUnsignedLongLong(result);
            Py_DECREF(result);
            return number;
        };
    }

  private:
    void SetText(const char *name, const char *text) const
    {
        PyObject *value = Check(PyUnicode_FromString(text));
        PyDict_SetItemString(globals_, name, value);
        Py_DECREF(value);
    }

    static PyObject *Check(PyObject *result)
    {
        if (!result) {
            PyErr_Print();
            std::exit(1);
        }
        return result;
    }

    PyObject *globals_;
};

bool WriteSettings()
{
    std::FILE *file = std::fopen(settings_file, "w");
    if (!file)
        return false;
    for (int i = 0; i < 100; ++i)
        std::fprintf(file, "key%d=\"value%d\"\n", i, i);
    return std::fclose(file) == 0;
}

bool AddUsers()
{
    std::vector<std::string> names;
    for (int i = 0; i < kUsers; ++i)
        names.push_back("user" + std::to_string(i));
    std::vector<TAVOUSER> users;
    std::vector<const TAVOUSER *> records;
    for (const std::string &name : names) {
        TAVOUSER user = {};
        user.szName = const_cast<char *>(name.c_str());
        user.nUid = user.nGid = user.nExpired = -1;
        users.push_back(user);
    }
    for (const TAVOUSER &user : users)
        records.push_back(&user);
    const std::vector<const char *> old_names(records.size());
    return TAVOUserSet(old_names.data(), records.data(), kUsers) == 0;
}

uint64_t CheckName()
{
    uint64_t valid = 0;
    for (int i = 0; i < 1000; ++i)
        valid += static_cast<uint64_t>(BlTLIBIsUserName("anna"));
    return valid;
}

uint64_t CompareTexts()
{
    uint64_t less = 0;
    for (int i = 0; i < 1000; ++i)
        less -= static_cast<uint64_t>(TLIBUnicodeUTF8StrCaseCmp("anna", "Bert"));
    return less;
}

uint64_t ReadSetting()
{
    uint64_t length = 0;
    for (int i = 0; i < 100; ++i) {
        char value[256];
        if (TLIBFileGetKeyValue(settings_file, "key50", value, sizeof value, 0) > 0)
            length += std::char_traits<char>::length(value);
    }
    return length;
}

uint64_t GetUser()
{
    uint64_t uids = 0;
    for (int i = 0; i < 100; ++i) {
        TAVOUSER *user = nullptr;
        if (TAVOUserGet("user100", &user) == 0)
            uids += static_cast<uint64_t>(user->nUid);
        TAVOUserFree(user);
    }
    return uids;
}

uint64_t ListUsers()
{
    TLIBSZLIST *names = PslTLIBSzListAlloc(512);
    const int count = names ? TAVOUserEnum(&names, TAVO_USER_LOCAL) : -1;
    TLIBSzListFree(names);
    return static_cast<uint64_t>(count);
}

}  // namespace

int main(int argc, char **argv)
{
    if (!std::getenv("TAVO_ROOT_FORM") || !AddUsers() || !WriteSettings()) {
        std::fprintf(stderr, "python_bench: run me in an appliance root: tools/appliance/enter\n");
        return 1;
    }
    const Script script;
    const auto in_python = [&](const char *contender, const char *name) {
        return bench::Contender{contender, script.Function(name)};
    };
    bench::Compare("python_check_name", 1000,
                   {{"tavo", CheckName},
                    in_python("module", "check_name_module"),
                    in_python("c_name", "check_name_c_name"),
                    in_python("ctypes", "check_name_ctypes")},
                   bench::Clock::processor);
    bench::Compare("python_compare_texts", 1000,
                   {{"tavo", CompareTexts},
                    in_python("module", "compare_texts_module"),
                    in_python("c_name", "compare_texts_c_name"),
                    in_python("ctypes", "compare_texts_ctypes")},
                   bench::Clock::processor);
    bench::Compare("python_read_setting", 100,
                   {{"tavo", ReadSetting},
                    in_python("module", "read_setting_module"),
                    in_python("ctypes", "read_setting_ctypes")});
    bench::Compare("python_get_user", 100,
                   {{"tavo", GetUser}, in_python("module", "get_user_module"), in_python("pwd", "get_user_pwd")});
    bench::Compare("python_list_users", kUsers, {{"tavo", ListUsers}, in_python("module", "list_users_module")});
    return bench::Run(argc, argv);
}
