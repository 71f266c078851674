// Converts between units of space.
#include "tavo_quota.h"

extern "C" float TAVOUnitTrans(int mode, float value)
{
    switch (mode) {
    case TAVO_UNIT_MB_TO_BYTE:
        return value * 1048576;
    case TAVO_UNIT_BYTE_TO_MB:
        return value / 1048576;
    case TAVO_UNIT_BYTE_TO_KB:
    case TAVO_UNIT_KB_TO_MB:
        return value / 1024;
    case TAVO_UNIT_KB_TO_BYTE:
    case TAVO_UNIT_MB_TO_KB:
        return value * 1024;
    default:
        return 0;
    }
}
