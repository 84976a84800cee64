/* Declares everything that libvorelix exports.
 *
 * The library carries the server side of an audio application on a storage device. It has no
 * thread, timer or main loop of its own: a call runs to completion on the caller's thread, and
 * callers are meant to be single-threaded. A failure of a flat function is written to the system
 * log at LOG_ERR unless its own comment says otherwise. Lists that a function returns are the
 * caller's.
 */
#ifndef VORELIX_H
#define VORELIX_H

#include <vorelix/config/config.h>
#include <vorelix/ipod/ipod.h>
#include <vorelix/library/musiclib.h>
#include <vorelix/misc/misc.h>
#include <vorelix/playlists/playlist.h>
#include <vorelix/records.h>

#ifdef __cplusplus
#include <vorelix/player/audiofile.h>
#include <vorelix/player/custom_key.h>
#include <vorelix/upnp/dmagent.h>
#include <vorelix/upnp/dmaparser.h>
#include <vorelix/users/audiousers.h>
#include <vorelix/web/actionhandler.h>
#endif

#endif
