/* The parameters of a request. What cannot be used is refused with kBadRequest and the name of the
 * parameter. */
#pragma once

#include <climits>
#include <cstddef>
#include <map>
#include <string>
#include <string_view>
#include <vector>

namespace webapi {

/* The most that a text is long and that a list has, where nothing else is said. */
inline constexpr std::size_t kMostTextBytes = 1024;
inline constexpr std::size_t kMostNumbers = 10000;

struct Bounds {
    int least = 0;
    int most = INT_MAX;
};

class Parameters {
  public:
    /* Adds those of a query or body: "a=1&b=two+words". A name that is there already gets the new
     * value. Signs that are no escape stand for themselves. Throws Refusal for a text that is not
     * UTF-8 or has a NUL in it, with the good parameters added. */
    void add(std::string_view form);

    bool has(std::string_view name) const { return find(name) != nullptr; }

    /* "" when it is missing. */
    std::string text(const char *name, std::size_t mostBytes = kMostTextBytes) const;

    /* A decimal number, with nothing around it. */
    int number(const char *name, Bounds bounds) const;
    int numberOr(int otherwise, const char *name, Bounds bounds) const;

    /* Numbers with commas between them; none when it is missing or empty. */
    std::vector<int> numbers(const char *name, Bounds bounds) const;

    /* One of `words`, the first of them when it is missing. */
    template <typename Words>
    const char *choice(const char *name, const Words &words) const {
        const std::string *value = find(name);
        for (const char *word : words) {
            if (value == nullptr || *value == word) {
                return word;
            }
        }
        refuse(name);
    }

  private:
    const std::string *find(std::string_view name) const;
    [[noreturn]] static void refuse(const char *name, int line = __builtin_LINE());

    std::map<std::string, std::string, std::less<>> values_;
};

/* The number that a whole text of digits is; false for anything else, and out of bounds. */
bool readNumber(std::string_view text, Bounds bounds, int &number);

}  // namespace webapi
