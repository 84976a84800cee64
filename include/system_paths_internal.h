/* Every fixed path of the device, once.
 *
 * ZANO_ROOT is a compile-time prefix: empty on a device, a folder below the build folder in the
 * presets `dev` and `local`, so that tests and ./run need no privileges and leave nothing on
 * the machine. No program takes a root from its environment. */
#ifndef VORELIX_SYSTEM_PATHS_INTERNAL_H
#define VORELIX_SYSTEM_PATHS_INTERNAL_H

#ifndef ZANO_ROOT
#error "ZANO_ROOT is set by the build; it is the empty text for device paths"
#endif

#define ZANO_PATH_MUSIC_LINK ZANO_ROOT "/var/services/music"
#define ZANO_PATH_CONF ZANO_ROOT "/usr/zano/etc/zano.conf"
#define ZANO_PATH_PASSWD ZANO_ROOT "/usr/zano/etc/passwd"
#define ZANO_PATH_GROUP ZANO_ROOT "/usr/zano/etc/group"
#define ZANO_PATH_AUDIO_USERS ZANO_ROOT "/usr/zano/etc/audio.users"
#define ZANO_PATH_AUDIO_FOLDER ZANO_ROOT "/usr/zano/etc/audio"
#define ZANO_PATH_AUDIO_CONF ZANO_PATH_AUDIO_FOLDER "/audio.conf"
#define ZANO_PATH_AUDIO_CONF_TEMPORARY ZANO_PATH_AUDIO_FOLDER "/audio.tmp"
#define ZANO_PATH_CUSTOM_KEYS ZANO_PATH_AUDIO_FOLDER "/custom_key.json"
#define ZANO_PATH_IPOD_FOLDER ZANO_PATH_AUDIO_FOLDER "/ipod/"
#define ZANO_PATH_MEDIA_DB ZANO_ROOT "/var/lib/zano/media.db"
#define ZANO_PATH_INDEXER ZANO_ROOT "/usr/zano/bin/zanoindex"
#define ZANO_PATH_MIME_GENERATOR ZANO_ROOT "/usr/zano/bin/confmimetype"
#define ZANO_PATH_MIME_MAPPING ZANO_ROOT "/tmp/mimetype.tmp"

#endif
