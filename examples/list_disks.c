/* Lists the disks: where they sit, what they are, how warm they are. Reading a temperature wakes a disk that sleeps. */
#include <tavosdk.h>

#include <stdio.h>

int main(void)
{
    DISKLIST *disks, *node;
    int count = DiskInfoEnum(NULL, &disks);

    if (count < 0) {
        fprintf(stderr, "the disks cannot be read: 0x%04X\n", (unsigned)TLIBErrGet());
        return 1;
    }
    for (node = disks; node; node = node->pNext) {
        const DISKINFO *disk = node->pInfo;

        printf("%-10s %-24s %7.1f GB", disk->szPath, disk->szModel, (double)disk->cbDisk / 1e9);
        if (disk->nTemperature >= 0)
            printf("  %d degrees", (int)disk->nTemperature);
        putchar('\n');
    }
    printf("%d disks in %d bays\n", count, TAVOMaxDiskGet());
    DiskInfoEnumFree(disks);
    return 0;
}
