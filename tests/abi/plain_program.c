/* A plain C program that uses the library as an outsider does: functions, and every kind of exported datum. */
#include <tavosdk.h>

#include <stdio.h>
#include <string.h>

static int failures;

static void check(int holds, const char *what)
{
    if (!holds) {
        failures++;
        printf("not so: %s\n", what);
    }
}

int main(void)
{
    int named = 0, i;
    char upper[16];
    TLIBSZLIST *list = PslTLIBSzListAlloc(0);

    for (i = 0; i < errNum; i++)
        named += rgszErrMsg[i][0] != '\0';
    check(errNum == 145 && named == 85, "the table of names is whole");
    check(strcmp(rgszErrMsg[0x0D00 / 0x100], "ERR_BAD_PARAMETERS") == 0, "a code finds its name");
    check(codeNum == 96, "codeNum is 96");

    /* What the library writes is seen here, and what is written here is seen by the library. */
    check(TLIBErrLogSet(NULL, "x") == -1 && tavoerrno == ERR_BAD_PARAMETERS, "tavoerrno is the library's own");
    tavoerrno = ERR_YP_BIND;
    check(TLIBErrGet() == ERR_YP_BIND, "the library reads what a program stored");
    volerr = 7;
    check(TAVOVolGetErr() == 7, "volerr likewise");
    check(rgslckList[0].fLockBit == 0x800 && rgslckList[20].fLockBit == 0, "the lock table is readable");
    check(grgAllTavoPartLayout[0].nVersion != 0 && sizeof grgAllTavoPartLayout == 920, "so are the layouts");
    check(PartType[0].szName != NULL && PartType[48].szName == NULL, "and the partition types");
    check(FHOSTHeaderSize == (int)sizeof stFHOSTHeader, "and the packets of discovery");

    check(TLIBSzListPush(&list, "one") == 0 && strcmp(SzTLIBSzListGet(list, 0), "one") == 0, "a list works");
    TLIBSzListFree(list);
    check(TLIBUnicodeUTF8StrUpper("gr\xC3\xBCn", upper, sizeof upper) == 6 && strcmp(upper, "GR\xC3\x9CN") == 0,
          "what is loaded when it is needed is found");
    return failures != 0;
}
