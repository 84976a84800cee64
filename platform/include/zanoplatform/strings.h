/* Texts on the heap and lists of texts. Thread-safe for different lists. */
#ifndef ZANOPLATFORM_STRINGS_H
#define ZANOPLATFORM_STRINGS_H

#include <zanoplatform/export.h>

ZANOPLATFORM_C_API_BEGIN

/* A text formatted as by printf, for KLIBCStrPut; null when memory ran out or the format is
 * null (KLIBCErrGet() tells which). KLIBCStrPut accepts null. */
ZANOPLATFORM_API char *KLIBCStrGet(const char *format, ...) __attribute__((format(printf, 1, 2)));
ZANOPLATFORM_API void KLIBCStrPut(char *text);

/* Trims spaces, tabs, line feeds and carriage returns at both ends, in place. Returns its
 * argument; null gives null. */
ZANOPLATFORM_API char *KLIBCStrTrimSpace(char *text);

/* A list of texts. It owns copies of its items. */
typedef struct SZLIST {
    int capacity; /* items that there is room for */
    int count;    /* number of items */
    int sorted;   /* not 0: KLIBCSzListSortItems keeps it sorted */
    int reserved;
    char **items; /* texts from malloc, the list's own */
} SZLIST, *PSZLIST;

/* A list with room for `capacity` items (it grows beyond); null when out of memory or the
 * capacity is negative. Freed with KLIBCSzListFree, which accepts null. */
ZANOPLATFORM_API PSZLIST KLIBCSzListAlloc(int capacity);
ZANOPLATFORM_API void KLIBCSzListFree(PSZLIST list);

/* Splits text at every occurrence of separator and puts the pieces, empty ones included, into
 * *list in place of what it held. A text without separator is one item, an empty text none.
 * Returns the number of items; -1 for a null argument, an empty separator or when memory ran
 * out, and *list is then empty. */
ZANOPLATFORM_API int KLIBCStrSep(const char *text, const char *separator, PSZLIST *list);

/* The item at an index from 0; null outside the list. Valid until the list changes. */
ZANOPLATFORM_API const char *KLIBCSzListGet(PSZLIST list, int index);

/* The index of the first item equal to text, byte for byte; -1 when there is none, and for a null
 * argument. A sorted list is searched by halving. */
ZANOPLATFORM_API int KLIBCSzListFind(PSZLIST list, const char *text);

/* Not 0: sorts the items by their bytes, and keeps the list sorted when it is filled anew. 0: new
 * items keep their order again. A null list is left alone. */
ZANOPLATFORM_API void KLIBCSzListSortItems(PSZLIST list, int keepSorted);

ZANOPLATFORM_C_API_END

#endif
