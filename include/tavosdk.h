/*
 * Every public header of libtavosdk.so.1.
 */
#ifndef TAVOSDK_H
#define TAVOSDK_H

#include "tavo_appliance.h"
#include "tavo_bdb.h"
#include "tavo_disk.h"
#include "tavo_error.h"
#include "tavo_fhost.h"
#include "tavo_file.h"
#include "tavo_group.h"
#include "tavo_hash.h"
#include "tavo_list.h"
#include "tavo_lock.h"
#include "tavo_lvm.h"
#include "tavo_net.h"
#include "tavo_partition.h"
#include "tavo_proc.h"
#include "tavo_quota.h"
#include "tavo_raid.h"
#include "tavo_section.h"
#include "tavo_service.h"
#include "tavo_str.h"
#include "tavo_user.h"

#endif
