/*
 * Every public header of libtavosdk.so.1.
 */
#ifndef TAVOSDK_H
#define TAVOSDK_H

#include "tavo_bdb.h"
#include "tavo_error.h"
#include "tavo_lock.h"
#include "tavo_net.h"
#include "tavo_proc.h"

#endif
