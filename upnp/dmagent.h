/* One request to the ContentDirectory:1 service of a media server, as SOAP over HTTP POST.
 *
 * An agent is for one request: make it, set the members of a DMABrowse, Perform, read `response`,
 * release that with free(), destroy the agent.
 *
 *     DMABrowse browse(DMAGENT_BROWSE_DIRECTCHILDREN, "http://192.0.2.7:8200/ctl/ContentDir");
 *     browse.objectID = "0";
 *     DMAParser parser;
 *     if (browse.Perform() == 0 && parser.Parse(&browse) == 0) { ... }
 *     free(browse.response);
 *
 * Servers are trusted to answer: there is no time limit, and see DecodeRDataHTML for an answer
 * that makes Perform never return. A program that asks servers it does not know does so in a child
 * process with a deadline, as the command `vorelix upnp` does.
 *
 * libcurl is loaded by the first agent of a process and stays loaded. Every transfer calls its
 * global initialisation and cleanup, so two must not run at the same time in one process, nor one
 * beside another use of libcurl. Nothing is logged, nothing is thrown. C++ only. */
#ifndef VORELIX_UPNP_DMAGENT_H
#define VORELIX_UPNP_DMAGENT_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <vorelix/export.h>

#include <string>

struct curl_slist;

/* The action; also its place in szSOAPAction. */
enum DMAGENT_ACTION : int {
    DMAGENT_ACTION_BROWSE = 0,
    DMAGENT_ACTION_GETSEARCHCAPABILITIES = 1,
    DMAGENT_ACTION_GETSORTCAPABILITIES = 2,
    DMAGENT_ACTION_GETSYSTEMUPDATEID = 3
};

/* The names that are sent: "Browse", "GetSearchCapabilities", "GetSortCapabilities",
 * "GetSystemUpdateID". A program may put others in their place before it makes an agent. */
extern VORELIX_API const char *szSOAPAction[4];

enum DMAGENT_BROWSETYPE : int {
    DMAGENT_BROWSE_METADATA = 0,       // the object itself: "BrowseMetadata"
    DMAGENT_BROWSE_DIRECTCHILDREN = 1  // what it contains: "BrowseDirectChildren", as for any other
};

class VORELIX_API DMAgent {
  public:
    /* For an action at the control URL of a server's ContentDirectory service. The header lines
     * "Content-Type" and "SOAPACTION" are made here. */
    DMAgent(DMAGENT_ACTION action, std::string url);

    /* Releases the header lines, and not `response`. */
    virtual ~DMAgent();

    DMAgent(const DMAgent &) = delete;
    DMAgent &operator=(const DMAgent &) = delete;

    /* Sends the request; the result is that of Send. */
    virtual int Perform() = 0;

    /* Adds the line "name: value" to the header of the request, or "name" when value is empty. When
     * memory runs out the header has no lines left. */
    void addHeader(std::string name, std::string value);

    /* Sends the action with a block of arguments (null: none), which goes into the envelope as it
     * is, waits for the answer and decodes it (DecodeRDataHTML).
     * 0; -1 when libcurl cannot be used, with nothing changed; else the CURLcode of the failure.
     * `response` holds what arrived, after a failure too; null when that is nothing. It is the
     * caller's, and is not released by a second Send. The status of the answer is not looked at:
     * an error page is a body like any other. Redirects are not followed.
     * An envelope of more than 4095 bytes is cut there. Each Send adds a line "Content-Length", so
     * a second one on the same agent sends two. When memory runs out, or a body has 4 GiB, what
     * arrived before is dropped without a word. */
    int Send(const char *arguments);

    /* Decodes &apos; &quot; &nbsp; (as a blank) &lt; &gt; and &amp; in `response`, in place and
     * once:
     * "&amp;lt;" becomes "&lt;". The text ends at its first NUL; responseSize stays the number of
     * bytes received. Nothing happens when responseSize is 0 or there is no response.
     * Never returns when an "&" begins none of the six: that byte is looked at again until another
     * one stands in its place. */
    void DecodeRDataHTML();

    DMAGENT_ACTION action;
    std::string url;
    char *response;             // NUL-terminated, for free(); null before the first transfer
    unsigned int responseSize;  // bytes received, without the NUL
    curl_slist *headers;        // the agent's own
};

/* The action Browse. The values go into the request as they are: an objectID with markup in it has
 * to be escaped by the caller. */
class VORELIX_API DMABrowse : public DMAgent {
  public:
    DMABrowse(DMAGENT_BROWSETYPE type, std::string url);
    ~DMABrowse() override;

    /* Sends the members below. The block of arguments is cut at 4095 bytes. */
    int Perform() override;

    DMAGENT_BROWSETYPE browseType;
    std::string objectID;    // "" unless set; "0" is the root of every server
    int startingIndex = 0;   // of the first object wanted
    int requestedCount = 0;  // 0: as many as the server gives
};

/* An action without arguments: any but Browse, which servers refuse without. */
class VORELIX_API DMAGet : public DMAgent {
  public:
    DMAGet(DMAGENT_ACTION action, std::string url);
    ~DMAGet() override;

    int Perform() override;
};

#endif
