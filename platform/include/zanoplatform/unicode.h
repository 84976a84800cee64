/* Comparison of texts in UTF-8. Any thread, no locale. */
#ifndef ZANOPLATFORM_UNICODE_H
#define ZANOPLATFORM_UNICODE_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* Compares two texts without regard to case in any script (Unicode's full case folding, so that
 * "STRASSE" equals "straße") and with regard to everything else: an accent makes another letter,
 * and so does a wide form or a byte that is not UTF-8. Names are told apart by this.
 * 0 when equal; below or above 0 as the first comes before or behind the second by its folded
 * characters. Null equals null and comes before every text. */
ZANOPLATFORM_API int KLIBCUnicodeUTF8StrCaseCmp(const char *one, const char *other);

ZANOPLATFORM_C_API_END

#endif
