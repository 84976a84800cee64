/* Settings of the device: lines key="value" in zano.conf. */
#ifndef ZANOPLATFORM_SETTINGS_H
#define ZANOPLATFORM_SETTINGS_H

#ifndef __cplusplus
#error "C++ only"
#endif

#include <zanoplatform/export.h>
#include <string>

/* A view of the settings file, read once when the object is made. Blank lines and lines that
 * begin with # are skipped, spaces around key and value and one pair of quotes around the value
 * are dropped; of two lines with one key the last counts. A missing or unreadable file is an
 * empty one; of a larger one the first MiB is read. Both functions throw std::bad_alloc when memory
 * runs out. Any thread. */
class ZANOPLATFORM_API ZanoConf {
  public:
    ZanoConf();
    /* The value of a key, or `fallback` when it is not set. */
    std::string Info(const std::string &key, const std::string &fallback = std::string()) const;

  private:
    std::string text_;
};

#endif
