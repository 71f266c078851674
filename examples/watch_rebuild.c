/* Watches the rebuild of an array until it ends: watch_rebuild /dev/md2
 * Exit status: 0 when the array is in order, 1 when it is not, 2 when there is none. */
#include <tavosdk.h>

#include <stdio.h>
#include <unistd.h>

int main(int argc, char **argv)
{
    RAIDINFO *array = NULL;
    int status;

    if (argc != 2) {
        fprintf(stderr, "usage: watch_rebuild ARRAY\n");
        return 2;
    }
    while (RAIDInfoGet(argv[1], &array) == 1 && array->fRebuilding) {
        printf("%s: %d of %d members work, rebuilding\n", array->szPath, (int)array->nWorking, (int)array->nSlot);
        fflush(stdout);
        RAIDInfoFree(array);
        array = NULL;
        sleep(5);
    }
    if (!array) {
        fprintf(stderr, "%s: no such array\n", argv[1]);
        return 2;
    }
    status = array->nStatus;
    printf("%s: %s\n", array->szPath, status == RAID_STATUS_NORMAL ? "in order" : "not in order");
    RAIDInfoFree(array);
    return status != RAID_STATUS_NORMAL;
}
