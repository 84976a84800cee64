/* Which features of the audio application each user of the device may use.
 *
 * The rights stand in one JSON file, "/usr/zano/etc/audio.users": an object with a member for each
 * user, named by the user's number in decimal, whose value is an object of five booleans:
 *
 *     { "1026" : { "editsong" : false, "playlist" : true, "streaming" : true, "upnp" : false,
 *                  "usb" : false } }
 *
 * The static functions read and write that file by themselves. A store is for changing entries: it
 * holds what it read and what was set, and nothing reaches the disk before Save. There is no lock:
 * of two programs that change the file at once, the one that saves last wins, and readers always
 * see a whole file. A store is for one thread. No function throws; a store that cannot be made
 * because memory ran out is the exception. C++ only, as jsoncpp is. */
#ifndef VORELIX_USERS_AUDIOUSERS_H
#define VORELIX_USERS_AUDIOUSERS_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <json/json.h>
#include <vorelix/export.h>

#include <string>
#include <vector>

class VORELIX_API AudioUsers {
  public:
    /* The bits of a mask of rights. They are an interface and do not change. */
    enum Permission : unsigned int {
        kUsb = 1,
        kStreaming = 2,
        kPlaylist = 4,
        kUpnp = 8,
        kEditSong = 16,
        kEveryPermission = 31
    };

    /* The rights of a user by name.
     * "admin", in capitals or small letters, has every right, whatever the file says. Everybody
     * else needs the privilege ZANO.VXT.Vorelix.Application (zanoplatform/privilege.h), and has
     * then what GetUser says of the file. 0 without the privilege, for a user that does not exist
     * and when the file cannot be read. */
    static unsigned int GetUserPermission(const std::string &userName);

    /* Removes the entries of users that do not exist any more, and writes the file anew even when
     * there were none. A file that cannot be read is left alone. A user that the platform does not
     * load counts as gone, even when it is the platform's users that cannot be read. */
    static void SyncUsers();

    /* Makes the file where there is none: every right for the user "admin", none for "guest", of
     * these those that exist. A file that is there is left as it is, empty or broken too. */
    static void InitUserPermission();

    /* A store without entries. */
    AudioUsers();

    /* Sets the entry of a user to the five bits of a mask; other bits are dropped. When memory runs
     * out the entry stays as it was. */
    void SetUser(unsigned int uid, unsigned int mask);

    /* The rights of a user by number: kStreaming when there is no entry; every right for the
     * administrator, 1024, when there is one; else the flags that are true. A flag that is
     * missing counts as false and is written as null by a Save of this store; a flag or an entry
     * of another shape counts as false too and stays as it is. */
    unsigned int GetUser(unsigned int uid);

    /* Removes the entry of a user; that there is none is no error. */
    void Remove(unsigned int uid);

    /* The numbers of the entries, in the order of their names as text. Entries whose name does not
     * begin with a number above 0 are left out. */
    std::vector<unsigned int> enumUsers();

    /* Writes the entries as indented JSON to path + ".tmp", mode 0644, and renames that to path.
     * True when the text was written whole, whatever the rename said; false, logged, when the
     * temporary file could not be opened or written, and path is as it was then. */
    bool Save(const std::string &path);

    /* Takes the entries of a file of at most 1 MiB (1048576 bytes) in place of those of the store.
     * False, with the store as it was: there is no such file, which is not logged; it cannot be
     * read, is larger, is no JSON or not an object, which is. */
    bool Read(const std::string &path);

  private:
    Json::Value users_;
};

#endif
