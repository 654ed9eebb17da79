#include "sample/StripPlanner.h"

#include <cstdio>
#include <utility>

namespace zvsample {

namespace {

const TagSet kTagSets[3] = {{"REGUA", "NUMERO"}, {"STRIP", "NUMBER"}, {"REGLETA", "NUMERO"}};

struct TerminalKind {
    const char* key;
    const char* block;
};
// Mostly feed-through terminals, now and then neutral, earth, disconnect and fuse ones.
const TerminalKind kKinds[] = {{"1001", "BORNE_PASSAGEM"}, {"1001", "BORNE_PASSAGEM"},
                               {"1001", "BORNE_PASSAGEM"}, {"1002", "BORNE_PASSAGEM"},
                               {"1010", "BORNE_PASSAGEM"}, {"1004", "BORNE_NEUTRO"},
                               {"1005", "BORNE_TERRA"},    {"1007", "BORNE_SECCIONAVEL"},
                               {"1008", "BORNE_FUSIVEL"},  {"1009", "BORNE_DOIS_NIVEIS"}};

// How a jumper group writes its texts. Users write them all these ways: every member
// naming the others, one member naming the others while they name nothing, and with a
// trailing comma. The groups take them in turn, so no random draw changes.
enum class JumperStyle { BothWays, FromFirst, BothWaysTrailingComma, FromLastTrailingComma };

// "n+1,n+2" style list of the group's other members, as the style wants it.
std::string jumperText(int first, int size, int self, JumperStyle style) {
    if (style == JumperStyle::FromFirst && self != first) return {};
    if (style == JumperStyle::FromLastTrailingComma && self != first + size - 1) return {};
    char buffer[64];
    int used = 0;
    for (int n = first; n < first + size; ++n) {
        if (n == self) continue;
        used += std::snprintf(buffer + used, sizeof buffer - static_cast<std::size_t>(used),
                              used ? ",%d" : "%d", n);
    }
    std::string text(buffer, static_cast<std::size_t>(used));
    if (style == JumperStyle::BothWaysTrailingComma || style == JumperStyle::FromLastTrailingComma)
        text += ',';
    return text;
}

}  // namespace

const TagSet& tagSet(int language) {
    return kTagSets[language >= 0 && language < 3 ? language : 0];
}

StripPlanner::StripPlanner(SampleRandom& random, std::string prefix, int firstStrip,
                           int* projectNext)
    : random_(random),
      prefix_(std::move(prefix)),
      stripIndex_(firstStrip - 1),
      projectNext_(projectNext) {}

void StripPlanner::startStrip() {
    ++stripIndex_;
    left_ = random_.between(12, 40);
    next_ = random_.chance(15) ? random_.between(2, 9) : 1;
    if (projectNext_) next_ += *projectNext_ - 1;
    jumperLeft_ = 0;
    stripName_.assign(prefix_).append(std::to_string(stripIndex_));
}

std::vector<PlannedTerminal> StripPlanner::plan(int count) {
    std::vector<PlannedTerminal> terminals;
    terminals.reserve(static_cast<std::size_t>(count));
    int groupFirst = 0, groupSize = 0;
    for (int i = 0; i < count; ++i) {
        if (left_ == 0) startStrip();
        PlannedTerminal t;
        t.language = stripIndex_ % 3;
        t.standard.assign(1, t.language == 1 ? '2' : '1');
        t.strip = stripName_;
        if (jumperLeft_ == 0 && random_.chance(4)) next_ += random_.between(1, 2);  // a gap
        t.number = next_++;
        if (projectNext_) *projectNext_ = next_;
        if (jumperLeft_ == 0 && left_ >= 3 && count - i >= 3 && random_.chance(12)) {
            groupFirst = t.number;
            groupSize = random_.between(2, 3);
            jumperLeft_ = groupSize;
            ++jumperGroups_;
        }
        if (jumperLeft_ > 0) {
            t.jumper = jumperText(groupFirst, groupSize, t.number,
                                  static_cast<JumperStyle>(jumperGroups_ % 4));
            --jumperLeft_;
        }
        const TerminalKind& kind = kKinds[random_.below(10)];
        t.key = kind.key;
        t.block = kind.block;
        if (random_.chance(5)) t.block = "BOR-PASSAGEM";
        t.inverted = random_.chance(5);
        --left_;
        terminals.push_back(std::move(t));
    }
    return terminals;
}

}  // namespace zvsample
