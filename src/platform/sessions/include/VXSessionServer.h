/* VXSessionServer: the optional session manager. It opens, shares and closes IviFgen sessions by
 * address, "IVI::IVIFGEN::" followed by a logical name. Sessions of one logical name are shared:
 * the driver session opens once and closes when the last session object is released.
 *
 * Functions that can fail return 0 or an error number and write a text of one or more lines into
 * `error` (`errorSize` characters with the NUL). The control loads this library at run time.
 */
#ifndef VXSESSIONSERVER_H
#define VXSESSIONSERVER_H

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef struct VXSessionManager VXSessionManager;
typedef struct VXSession VXSession;
typedef struct VXNameList VXNameList;

/* The number GetSession fails with for an address whose logical name nobody knows. */
#define VXSESSIONSERVER_ERROR_UNKNOWN_NAME 17304

int32_t VXSessionServer_CreateManager(VXSessionManager** manager, char* error, int32_t errorSize);
void VXSessionServer_ReleaseManager(VXSessionManager* manager);

int32_t VXSessionServer_GetSession(VXSessionManager* manager, const char* address, int32_t flags,
                                   VXSession** session, char* error, int32_t errorSize);
/* The options may hold "Reset=1" and "IDQuery=1"; the rest goes to the driver. Opening a session
 * whose driver session another object opened already does nothing. */
int32_t VXSessionServer_Open(VXSession* session, const char* options, char* error,
                             int32_t errorSize);
/* 1 while the driver session is usable, else 0. */
int32_t VXSessionServer_IsOpen(VXSession* session);
/* `which` 1: the IviFgen class session number; 0 when it is not open. */
int32_t VXSessionServer_Handle(VXSession* session, int32_t which, int32_t* handle, char* error,
                               int32_t errorSize);
/* Closes the driver session when no other object of the same logical name holds it. */
void VXSessionServer_ReleaseSession(VXSession* session);

/* The logical names of a class ("IVI::IviFgen"); the other two arguments are reserved. */
int32_t VXSessionServer_ListSessions(VXSessionManager* manager, const char* className,
                                     int32_t flags, int32_t reserved, VXNameList** names,
                                     char* error, int32_t errorSize);
int32_t VXSessionServer_NameCount(const VXNameList* names);
const char* VXSessionServer_Name(const VXNameList* names, int32_t index); /* from 0 */
void VXSessionServer_ReleaseNames(VXNameList* names);

#ifdef __cplusplus
}
#endif

#endif /* VXSESSIONSERVER_H */
