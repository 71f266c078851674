/* Finds the other appliances on the network, which takes about ten seconds: find_boxes [--collected]
 * --collected shows what the last search has left, without a new one. */
#include <tavosdk.h>

#include <stdio.h>
#include <string.h>

int main(int argc, char **argv)
{
    TLIBSZHASH *hosts = PshTLIBSzHashAlloc(4096);
    TLIBSZLIST *names = PslTLIBSzListAlloc(4096);
    int i;

    if (!hosts || !names)
        return 1;
    if ((argc < 2 || strcmp(argv[1], "--collected") != 0) && TAVOFHOSTDumpHost() != 0) {
        fprintf(stderr, "the search failed; the system log says why\n");
        return 1;
    }
    if (TAVOFHOSTGet2Hash(&hosts) < 0 || TLIBSzHashEnumKey(hosts, &names) < 0)
        return 1;
    TLIBSzListSortItems(names, TLIB_SZLIST_CASESORTED);
    for (i = 0; i < names->nItem; i++)
        printf("%-16s %s\n", SzTLIBSzHashGetValue(hosts, names->pszItem[i]), names->pszItem[i]);
    TLIBSzListFree(names);
    TLIBSzHashFree(hosts);
    return 0;
}
