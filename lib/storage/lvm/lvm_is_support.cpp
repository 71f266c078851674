// Checks whether the model uses LVM.
#include "tavo_lvm.h"

#include "core/detail/guard.h"
#include "core/detail/model_setting.h"

extern "C" int LVMIsSupport(void)
{
    return Guard([] { return tavo::ModelHas("supportraid"); }) ? 1 : 0;
}
