// Reports on the services of the appliance: which are enabled, which run, and which were left behind by a crash.
#include <tavosdk.h>

#include <cstdio>

int main()
{
    TLIBSZLIST *names = PslTLIBSzListAlloc(0);
    if (!names || TAVOServiceGetAll(&names) < 0)
        return 1;
    int trouble = 0;
    for (int i = 0; i < names->nItem; ++i) {
        const int id = TAVOServiceIndexGet(names->pszItem[i]);
        const char *key = TAVOServiceKeyGet(id);
        const bool enabled = key && BlTAVOFileCheckKeyValue("/etc/tavoinfo.conf", key, "yes") == 1;
        const bool on = TAVOServiceStatusGet(id) == 1;
        const char *state = on ? "on" : enabled ? "ENABLED, BUT NOT RUNNING" : "off";
        trouble += enabled && !on;
        std::printf("%-16s %s\n", names->pszItem[i], state);
    }
    TLIBSzListFree(names);
    return trouble ? 1 : 0;
}
