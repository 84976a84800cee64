/* The answer of a CGI program (CGI/1.1, RFC 3875): header and JSON body (RFC 8259) on its standard
 * output. One thread at a time. */
#ifndef ZANOPLATFORM_WEB_OUTPUT_H
#define ZANOPLATFORM_WEB_OUTPUT_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <json/json.h>
#include <zanoplatform/export.h>

/* Writes one answer, through stdio's stdout. A browser that has gone away is not reported. */
class ZANOPLATFORM_API WebMan {
  public:
    /* false: the answer is kept by no cache. true: the user's own browser may keep it. */
    explicit WebMan(bool isCacheable);

    /* The header with its empty line at the end. contentType, not null, is cut at its first control
     * character, which could end the line. Once, before the body. */
    void WriteHeader(const char *contentType);

    /* The value on one line, without a line feed at its end, and all that was written before on
     * its way to the server. Texts are UTF-8; a byte that is not becomes U+FFFD, so that one bad
     * file name does not cost the whole answer. Fractions have at most 15 significant digits, as
     * many as every decimal keeps. Throws std::bad_alloc with nothing written. */
    void WriteBody(const Json::Value &body);

  private:
    bool isCacheable_;
};

#endif
