#include "table.h"

#include <algorithm>
#include <numeric>

#include "text.h"

namespace vorelix {

namespace {

constexpr int kGap = 2;
constexpr int kLeastCutWidth = 16;

/* A column that is shown: which one, and its cells. */
struct Slot {
    size_t index;
    int width;
};

int lineWidth(const std::vector<Slot> &slots) {
    return std::accumulate(slots.begin(), slots.end(), -kGap,
                           [](int sum, const Slot &slot) { return sum + slot.width + kGap; });
}

/* The widest column that can still give a cell, or null. */
Slot *widestToCut(std::vector<Slot> &slots, const std::vector<Table::Column> &columns, int least) {
    Slot *widest = nullptr;
    for (Slot &slot : slots) {
        if (columns[slot.index].cut && slot.width > least &&
            (widest == nullptr || slot.width > widest->width)) {
            widest = &slot;
        }
    }
    return widest;
}

bool shrink(std::vector<Slot> &slots, const std::vector<Table::Column> &columns, int least,
            int width) {
    while (lineWidth(slots) > width) {
        Slot *widest = widestToCut(slots, columns, least);
        if (widest == nullptr) {
            return false;
        }
        --widest->width;
    }
    return true;
}

bool leaveOneOut(std::vector<Slot> &slots, const std::vector<Table::Column> &columns) {
    const auto highest =
        std::max_element(slots.begin(), slots.end(), [&](const Slot &a, const Slot &b) {
            return columns[a.index].rank < columns[b.index].rank;
        });
    if (columns[highest->index].rank == 0) {
        return false;
    }
    slots.erase(highest);
    return true;
}

std::vector<Slot> fitted(const std::vector<Slot> &natural,
                         const std::vector<Table::Column> &columns, int width) {
    std::vector<Slot> shown = natural;
    while (true) {
        std::vector<Slot> slots = shown;
        if (shrink(slots, columns, kLeastCutWidth, width)) {
            return slots;
        }
        if (!leaveOneOut(shown, columns)) {
            shrink(slots, columns, 1, width);
            return slots;
        }
    }
}

std::string lineOf(const std::vector<std::string> &texts, const std::vector<Slot> &slots,
                   const std::vector<Table::Column> &columns) {
    std::string line;
    size_t gap = 0;  // spaces that are due once something follows them
    for (const Slot &slot : slots) {
        const std::string text = cutToWidth(texts[slot.index], slot.width);
        const auto padding = static_cast<size_t>(slot.width - displayWidth(text));
        const bool right = columns[slot.index].right;
        if (!text.empty()) {
            line.append(gap + (right ? padding : 0), ' ').append(text);
            gap = (right ? 0 : padding) + kGap;
        } else {
            gap += padding + kGap;
        }
    }
    return line;
}

}  // namespace

void Table::addRow(std::vector<std::string> texts) {
    std::transform(texts.begin(), texts.end(), texts.begin(),
                   [](const std::string &text) { return printable(text); });
    rows_.push_back(std::move(texts));
}

std::string Table::render(const Terminal &terminal) const {
    std::vector<std::string> headers;
    std::vector<Slot> slots;
    for (size_t i = 0; i < columns_.size(); ++i) {
        headers.push_back(columns_[i].header);
        Slot slot{i, displayWidth(columns_[i].header)};
        for (const auto &row : rows_) {
            slot.width = std::max(slot.width, displayWidth(row[i]));
        }
        slots.push_back(slot);
    }
    if (terminal.width > 0) {
        slots = fitted(slots, columns_, terminal.width);
    }
    std::string out = lineOf(headers, slots, columns_);
    out = (terminal.bold ? "\x1b[1m" + out + "\x1b[0m" : out) + "\n";
    for (const auto &row : rows_) {
        out += lineOf(row, slots, columns_) + "\n";
    }
    return out;
}

}  // namespace vorelix
