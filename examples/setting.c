/* Shows a setting of the appliance, or changes it: setting FILE KEY [VALUE] */
#include <tavosdk.h>

#include <stdio.h>

int main(int argc, char **argv)
{
    char value[256];

    if (argc < 3 || argc > 4) {
        fprintf(stderr, "usage: setting FILE KEY [VALUE]\n");
        return 2;
    }
    if (argc == 4 && TLIBFileSetKeyValue(argv[1], argv[2], argv[3], NULL) < 0) {
        fprintf(stderr, "0x%04X from %s:%d\n", (unsigned)TLIBErrGet(), TAVOErrorGetFile(), TAVOErrorGetLine());
        return 1;
    }
    if (TLIBFileGetKeyValue(argv[1], argv[2], value, sizeof value, 0) <= 0) {
        fprintf(stderr, "%s: no such key in %s\n", argv[2], argv[1]);
        return 1;
    }
    puts(value);
    return 0;
}
