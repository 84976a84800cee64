/* An open file that closes itself. */
#pragma once

#include <unistd.h>

namespace vorelix {

class Descriptor {
  public:
    /* What open() gave; -1 stands for no file. */
    explicit Descriptor(int number) : number_(number) {}
    ~Descriptor() {
        if (number_ != -1) {
            close(number_);
        }
    }
    Descriptor(const Descriptor &) = delete;
    Descriptor &operator=(const Descriptor &) = delete;

    int number() const { return number_; }

  private:
    int number_;
};

}  // namespace vorelix
