/*
 * Services: the table of the appliance's services, their state, and switching them.
 *
 * The tables are compiled in and constant. All state is elsewhere: the enable keys in /etc/tavoinfo.conf, the
 * capabilities of the model in /etc.defaults/tavoinfo.conf, the data folders to which the links under /var/services
 * point, and the daemons, which the scripts under /usr/tavo/etc/rc.d/ start and stop.
 */
#ifndef TAVO_SERVICE_H
#define TAVO_SERVICE_H

#include "tavo_error.h"
#include "tavo_list.h"

TAVO_BEGIN_DECLS

typedef struct TAVOSERVICE TAVOSERVICE;

/* Switches a service; action is one of the codes below. Returns 0 or -1 with a code. */
typedef int (*TAVOSERVICEACTION)(const TAVOSERVICE *pService, int action);

/* Returns 1 when the service is enabled and running, else 0. */
typedef int (*TAVOSERVICESTATUS)(const TAVOSERVICE *pService);

/* One service. Texts are NULL where the service has none. The rows belong to the library. */
struct TAVOSERVICE {
    const char *szName;         /* unique; compared with regard to case */
    const char *szScript;       /* start-up script: takes "start", "stop" or "restart" */
    const char *szKey;          /* enable key in /etc/tavoinfo.conf: "yes" or "no" */
    const char *szProc;         /* a pid file when it holds a "/", else the name of a process */
    TAVOSERVICEACTION pfAction; /* NULL: driven by its daemon mask alone */
    TAVOSERVICESTATUS pfStatus;
    uint32_t fDaemon;     /* bits that TAVONetService understands; 0: none */
    int32_t rgShareId[4]; /* its data folders, in the order in which they are bound; ended by 12 */
};

/* The value that ends rgShareId. */
#define TAVO_SERVICE_SHARE_END 12

/* The data folder of a service: a row of the share table, filled in by TAVOServiceSettingGet. */
typedef struct TAVOSERVICESHARE {
    int32_t nId;           /* 1 to 11 */
    int32_t fOnVolume;     /* 1: the link points to an existing folder */
    char szShare[52];      /* stem of the share's name */
    char szLink[52];       /* the symbolic link under /var/services */
    char szEnableKey[52];  /* key in /etc/tavoinfo.conf; "" for none */
    char szVolume[52];     /* the link's target */
    char szVolumePath[52]; /* the directory that holds the target */
    char szShareName[128]; /* the stem in the form that nNaming selects */
    int32_t fSupported;    /* 1: the model has this service */
    int32_t nNaming;       /* 0 "@%s" (hidden), 1 "%s", 2 "@database/%s" */
    int32_t nAttributeA;   /* constants of the row */
    int32_t nAttributeB;
    int32_t nReserved;      /* 0 */
    int32_t fSpecialVolume; /* 1: on an external or a remote volume */
} TAVOSERVICESHARE;

/* Actions of TAVOServiceActionSet and of the action handlers. */
enum {
    TAVO_SERVICE_ENABLE = 0,  /* set the key to "yes", bind the data folders, start */
    TAVO_SERVICE_DISABLE = 1, /* set the key to "no", stop, release the data folders */
    TAVO_SERVICE_STOP = 2,
    TAVO_SERVICE_START = 3,
    TAVO_SERVICE_RESTART = 4,
    TAVO_SERVICE_KEY_NO = 5, /* set only the key */
    TAVO_SERVICE_KEY_YES = 6
};

/* Operations of TAVONetService. */
enum { TAVO_DAEMON_STOP = 1, TAVO_DAEMON_START = 2, TAVO_DAEMON_RESTART = 3, TAVO_DAEMON_RELOAD = 4 };

/* Daemons of TAVONetService, one bit each. */
#define TAVO_DAEMON_AFP          0x00000001u
#define TAVO_DAEMON_MEDIA        0x00000002u
#define TAVO_DAEMON_SMB          0x00000004u
#define TAVO_DAEMON_CRON         0x00000008u
#define TAVO_DAEMON_FTP          0x00000010u
#define TAVO_DAEMON_DATABASE     0x00000020u /* the database servers and the services built on them */
#define TAVO_DAEMON_WEB_USER     0x00000040u
#define TAVO_DAEMON_THUMBNAIL    0x00000080u
#define TAVO_DAEMON_NETBKP       0x00000100u
#define TAVO_DAEMON_DOWNLOAD     0x00000200u
#define TAVO_DAEMON_PRINTER      0x00000400u
#define TAVO_DAEMON_PLAYER       0x00000800u /* media sharing for players */
#define TAVO_DAEMON_INDEX        0x00001000u
#define TAVO_DAEMON_SURVEILLANCE 0x00002000u
#define TAVO_DAEMON_VIDEO        0x00004000u /* video conversion */
#define TAVO_DAEMON_NFS          0x00008000u
#define TAVO_DAEMON_RESTORE      0x00010000u
#define TAVO_DAEMON_MDNS         0x00020000u
#define TAVO_DAEMON_REMOTE       0x00040000u /* remote control */
#define TAVO_DAEMON_LOG          0x00080000u
#define TAVO_DAEMON_ISCSI        0x00100000u
#define TAVO_DAEMON_AUDIO        0x00200000u
#define TAVO_DAEMON_WEBDAV       0x00400000u
#define TAVO_DAEMON_WEB_SYSTEM   0x80000000u

/*
 * Look-ups. They read only the tables; for a bad id they return NULL or -1 with ERR_BAD_PARAMETERS. Rows and texts
 * belong to the library and are never freed.
 */

/* Returns the row of a service, id 0 to 30; row 30 is the empty one that ends the table. */
TAVO_API const TAVOSERVICE *TAVOServiceInfoGet(int id);

/* Returns the id of the service with exactly this name; -1 when there is none (no code) or the name is NULL
 * (ERR_BAD_PARAMETERS). */
TAVO_API int TAVOServiceIndexGet(const char *szName);

/* Return one text of a row; NULL without a code when the service has none. */
TAVO_API const char *TAVOServiceNameGet(int id);
TAVO_API const char *TAVOServiceScriptGet(int id);
TAVO_API const char *TAVOServiceKeyGet(int id);
TAVO_API const char *TAVOServiceProcGet(int id);

/* Returns the daemon mask of a service; -1 for a bad id. */
TAVO_API int TAVOServiceDaemonIDGet(int id);

/* Returns the ids of the data folders of a service, ended by TAVO_SERVICE_SHARE_END. */
TAVO_API const int32_t *TAVOServiceShareIDGet(int id);

/* Returns how a service is driven: 0 bound to data folders (and always the printer, id 9), 1 by its script, 2 only by
 * its key, 3 only by its daemon mask, -1 by none of these, or for a bad id. */
TAVO_API int TAVOServiceTypeGet(int id);

/* Returns the daemons that serve a kind of data folder, by its name without regard to case: "web", "NetBackup",
 * "surveillance", "photo", "video", "music"; 0 for any other name, -1 with ERR_BAD_PARAMETERS for NULL or "". */
TAVO_API int TAVOServiceDaemonGet(const char *szName);

/*
 * State.
 */

/* Fills *pShare for data folder idShare, 1 to 11: the constant row, the share's name, the capability of the model (keys
 * of /etc.defaults/tavoinfo.conf), and the target of the link under /var/services. Clears the error state when there
 * is a link.
 * Returns 1 when the folder exists on a volume, 0 when not, -1 with *pShare filled in as far as known and
 *   ERR_BAD_PARAMETERS  bad id or NULL; *pShare untouched
 *   ERR_UNKNOWN         the link cannot be read, or its target is longer than 51 bytes
 * Files: /etc.defaults/tavoinfo.conf, /var/services */
TAVO_API int TAVOServiceSettingGet(int idShare, TAVOSERVICESHARE *pShare);

/* Reads the link szLink: copies its target to szVolume (cbVolume bytes) and the directory that holds the target to
 * szPath (cbPath bytes); for a target with "database" in it, the directory above that one.
 * Returns 1 when the target is a folder, 0 when not or when there is no link (both buffers empty), -1 with
 *   ERR_BAD_PARAMETERS  a NULL or empty argument, or a size below 1
 *   ERR_UNKNOWN         not a link, not readable, or a target that does not fit */
TAVO_API int TAVOServiceVolumeGetbyLink(const char *szLink, char *szVolume, int cbVolume, char *szPath, int cbPath);

/* Returns 1 when the enable key of data folder idShare is "yes" (any case) in /etc/tavoinfo.conf, else 0. For the
 * download scheduler (4) the answer comes from its own settings, /usr/tavo/etc/download.conf: 0 when the key is
 * missing; when the file cannot be read, 0 with ERR_OPEN_FAILED or another code of TLIBFileGetKeyValue.
 * ERR_BAD_PARAMETERS: bad id.
 * Files: /etc/tavoinfo.conf, /usr/tavo/etc/download.conf */
TAVO_API int TAVOServiceEnableGet(int idShare);

/* Returns 1 when the status handler of service id reports it as enabled, bound and running, else 0. ERR_BAD_PARAMETERS:
 * bad id, or the empty row.
 * Files: /etc/tavoinfo.conf, /var/services */
TAVO_API int TAVOServiceStatusGet(int id);

/* Pushes the names of the services that the model supports onto *ppNames, which may move; a service without data
 * folders always counts. Returns the number pushed, or -1 with ERR_BAD_PARAMETERS (NULL) or ERR_OUT_OF_MEMORY.
 * Files: /etc.defaults/tavoinfo.conf */
TAVO_API int TAVOServiceGetAll(TLIBSZLIST **ppNames);

/* The same for the services that have a data folder on volume szVolume ("/volume1").
 * Files: /var/services */
TAVO_API int TAVOServiceGetbyVolume(const char *szVolume, TLIBSZLIST **ppNames);

/* Copies the volume ("/volume1") of the share szShare, as recorded in /usr/tavo/etc/share.conf, to szVolume.
 * Returns the length with its NUL, 0 with ERR_NO_SUCH_SHARE, -1 with ERR_BAD_PARAMETERS or ERR_NOT_ENOUGH_MEMORY.
 * Files: /usr/tavo/etc/share.conf */
TAVO_API int TAVOServiceVolumeGetbyShare(const char *szShare, char *szVolume, int cbVolume);

/* Returns 1 when the link of data folder idShare points to a folder on volume szVolume, 0 when not, -1 with
 * ERR_BAD_PARAMETERS or a code of TAVOServiceSettingGet.
 * Files: /etc.defaults/tavoinfo.conf, /var/services */
TAVO_API int TAVOServiceIsOnVolume(int idShare, const char *szVolume);

/* Searches every mounted volume for an existing folder of data folder idShare; the path of the first such volume is
 * copied to szVolume ("/volume2"). Returns the number of that volume, 0 when there is none, -1 with ERR_BAD_PARAMETERS.
 * */
TAVO_API int TAVOServiceDataSearch(int idShare, char *szVolume, int cbVolume);

/*
 * Control.
 */

/* Switches service id; programs use only this function. action is TAVO_SERVICE_ENABLE to TAVO_SERVICE_KEY_YES.
 * Returns 0, or -1, the steps done until then staying in effect, and
 *   ERR_BAD_PARAMETERS      bad id or action, or an action that a service without a key does not have
 *   ERR_SERVICE_ACTION      the service cannot be switched
 *   ERR_SERVICE_STD_ACTION  its script or its daemons failed
 *   or a code of a function that the service's handler calls
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceActionSet(int id, int action);

/* The standard handlers: of the action (see TAVOServiceActionSet), and of the status. A service counts as enabled
 * unless its key is "no". The status handler reads the key under TAVO_LOCK_TAVOINFO (shared, at most 5 s).
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d
 * Locks: TAVO_LOCK_TAVOINFO */
TAVO_API int TAVOServiceSTDAction(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceSTDStatus(const TAVOSERVICE *pService);

/* The handlers of single services; their sources describe what they do beyond the standard ones.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceAFP(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceAudio(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceHTTPS(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceNetBkp(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceSAMBA(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceSSH(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceTelnet(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceUserHome(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceiTunes(const TAVOSERVICE *pService, int action);
TAVO_API int TAVOServiceAFPStatus(const TAVOSERVICE *pService);
TAVO_API int TAVOServiceFTPStatus(const TAVOSERVICE *pService);
TAVO_API int TAVOServicePrinterStatus(const TAVOSERVICE *pService);
TAVO_API int TAVOServiceSSHStatus(const TAVOSERVICE *pService);
TAVO_API int TAVOServiceTelnetStatus(const TAVOSERVICE *pService);
TAVO_API int TAVOServiceiTunesStatus(const TAVOSERVICE *pService);

/* Stops, starts, restarts or reloads the daemons of fDaemon (TAVO_DAEMON_*) in a fixed order, under the locks of the
 * settings file, of Samba and of the Apple services (exclusive, at most 5 s), which are held until the last script has
 * ended. A start script must not call a function that takes one of them: it would wait until its time-out and fail.
 * With both web servers in fDaemon, whatever the operation, the user's is stopped, the system's restarted and the
 * user's started again.
 * Returns the bits whose commands succeeded (0x40000000 is the system web server), 0 when none did, or -1 with
 *   ERR_BAD_PARAMETERS  no daemon or no such operation
 *   ERR_LOCK_FAILED     another process is switching services, or changing one of those files
 * Runs: /usr/tavo/etc/rc.d
 * Locks: TAVO_LOCK_TAVOINFO, TAVO_LOCK_SMB, TAVO_LOCK_APPLE */
TAVO_API int TAVONetService(uint32_t fDaemon, int operation);

/* Sets the enable key of data folder idShare to "no" and nothing else. Returns 0 or -1.
 * Files: /etc/tavoinfo.conf */
TAVO_API int TAVOServiceDisableSet(int idShare);

/* Stops (fOn 0) or starts (fOn 1) every enabled service, the last ones first when stopping; keys stay unchanged.
 * Failures are logged and do not stop it. Returns the number of services that were switched.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceOnOffALL(int fOn);

/* Runs the start-up scripts of installed packages (/usr/tavo/etc/rc.d/packages, in the order of their names, in
 * reverse for "stop") with the argument "start", "stop" or "restart". Returns the number of scripts that succeeded, or
 * -1 with
 * ERR_BAD_PARAMETERS, or with ERR_READ_FAILED and no script run when the folder of packages cannot be read.
 * Files: /usr/tavo/etc/rc.d/packages (read)
 * Runs: /usr/tavo/etc/rc.d/packages */
TAVO_API int TAVOServiceThirdPartyAll(const char *szAction);

/*
 * Data folders. A folder is bound when its share is recorded in /usr/tavo/etc/share.conf (which is changed under the
 * lock of the shares) and its link under /var/services points to it. fDelete 0 keeps the data of a folder that is
 * released; 1 deletes it.
 */

/* Chooses the volume of data folder idShare: the one that its link names if that is mounted and the folder exists,
 * else the mounted and writable one with the most free space. Its path is copied to szVolume. Returns its number, 0
 * with
 * ERR_NO_SERVICE_VOLUME, -1 with ERR_BAD_PARAMETERS, or with ERR_UNKNOWN when the link cannot be read.
 * Files: /var/services */
TAVO_API int TAVOServiceNewVolumeDecide(int idShare, char *szVolume, int cbVolume);

/* Binds data folder idShare to volume szVolume: creates the share, then sets the link. A volume that is not mounted is
 * accepted and logged as an error: data written there ends up on the system disk. Returns 0, or -1 with the code of
 * TAVOServiceShareCreate or TAVOServiceLinkSet; a share that was created stays when the link fails.
 * Files: /usr/tavo/etc/share.conf, /var/services
 * Locks: TAVO_LOCK_SMB (exclusive, at most 5 s) */
TAVO_API int TAVOServiceSet(int idShare, const char *szVolume);

/* Copies the path of data folder idShare on volume szVolume to szPath. Returns its length with the NUL, or -1 with
 * ERR_BAD_PARAMETERS or ERR_NOT_ENOUGH_MEMORY. */
TAVO_API int TAVOServiceShareGen(int idShare, const char *szVolume, char *szPath, int cbPath);

/* Creates the folder (and its parents below the volume) and records the share; an existing folder is used unchanged.
 * Returns 0, or -1 with ERR_BAD_PARAMETERS, ERR_MKDIR_FAILED, ERR_NOT_ENOUGH_SPACE or a code of the settings files.
 * Files: /usr/tavo/etc/share.conf
 * Locks: TAVO_LOCK_SMB (exclusive, at most 5 s) */
TAVO_API int TAVOServiceShareCreate(int idShare, const char *szVolume);

/* Records a new volume for a share that exists; nothing is moved. Returns 0, or -1 (ERR_NO_SUCH_SHARE, ...).
 * Files: /usr/tavo/etc/share.conf
 * Locks: TAVO_LOCK_SMB (exclusive, at most 5 s) */
TAVO_API int TAVOServiceShareUpdate(int idShare, const char *szVolume);

/* Removes the record of the share and, with fDelete 1, deletes its folder; links in it are deleted, never followed. A
 * share that is not recorded is not a failure. Returns 0, or -1 with ERR_REMOVE_FAILED or a code of the settings files.
 * Files: /usr/tavo/etc/share.conf
 * Locks: TAVO_LOCK_SMB (exclusive, at most 5 s) */
TAVO_API int TAVOServiceShareRemove(int idShare, int fDelete);

/* Returns 1 when the folder to which the link points is empty, 0 when not, -1 with ERR_BAD_PARAMETERS, or ERR_MAKE_PATH
 * when it cannot be opened or reading it fails.
 * Files: /var/services */
TAVO_API int TAVOServiceShareIsEmpty(int idShare);

/* Points the link of data folder idShare at szTarget; an existing link is replaced, anything else is left alone.
 * Returns 0, or -1 with
 *   ERR_BAD_PARAMETERS    bad id, or szTarget is NULL or empty
 *   ERR_NOT_ENOUGH_SPACE  no room for /var/services
 *   ERR_MKDIR_FAILED      /var/services or the link could not be created
 * Files: /var/services */
TAVO_API int TAVOServiceLinkSet(int idShare, const char *szTarget);

/* Removes the link; a missing link is not a failure. Returns 0, or -1 with ERR_BAD_PARAMETERS, or ERR_REMOVE_FAILED
 * when something else is in its place or the link cannot be removed.
 * Files: /var/services */
TAVO_API int TAVOServiceLinkRemove(int idShare);

/* Release data folders, first the link, then the share: one folder, those of a service (by row or by id), of every
 * service that has a folder on a volume, or all. A folder that another enabled service uses is kept. Return 0, or -1
 * with
 * ERR_SERVICE_REMOVE after the other folders have been released.
 * Files: /etc/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Locks: TAVO_LOCK_SMB (exclusive, at most 5 s) */
TAVO_API int TAVOServiceRemove(int idShare, int fDelete);
TAVO_API int TAVOServiceRemovebyInfo(const TAVOSERVICE *pService, int fDelete);
TAVO_API int TAVOServiceRemovebyID(int id, int fDelete);
TAVO_API int TAVOServiceRemovebyVolume(const char *szVolume, int fDelete);
TAVO_API int TAVOServiceRemoveAll(int fDelete);

/* Binds data folder idShare to another volume and restarts the services that use it and are enabled; data is not moved.
 * Returns 0 or -1.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceVolumeChange(int idShare, const char *szVolume);

/* For a volume szVolume that is available again: sets the links of the data folders on it whose services are enabled,
 * and starts those services. Returns the number of folders that were bound again, or -1 with ERR_BAD_PARAMETERS.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceRestore(const char *szVolume);

/* For the first volume after a time without any: enables the data folders of every enabled service whose link is
 * broken, and restarts the service. Returns the number of services that were restarted.
 * Files: /etc/tavoinfo.conf, /etc.defaults/tavoinfo.conf, /usr/tavo/etc/share.conf, /var/services
 * Runs: /usr/tavo/etc/rc.d */
TAVO_API int TAVOServiceRestartfromVolumeNone(void);

TAVO_END_DECLS

#endif
