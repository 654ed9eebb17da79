#pragma once
// Plans the terminals of a sample project: strips of varied length in the three tag
// languages, some starting above 1, gaps in the numbering, jumpers between neighbours (both
// ways, one way, with trailing commas), inverted terminals and a few BOR- blocks.
#include <string>
#include <vector>
#include "sample/SampleRandom.h"

namespace zvsample {

// The tag set of a block: 0 Portuguese, 1 English, 2 Spanish.
struct TagSet {
    const char* strip;
    const char* number;
};
const TagSet& tagSet(int language);

struct PlannedTerminal {
    std::string strip;
    int number = 0;
    std::string jumper;  // numbers of bridged terminals, cut by ","
    bool inverted = false;
    std::string block;  // BORNE_... or BOR-...
    std::string key;    // catalogue key
    std::string standard;
    int language = 0;
};

class StripPlanner {
public:
    // With `projectNext`, numbers come from that counter, shared with other planners, instead
    // of starting again on each strip; a strip that would start above 1 leaves a gap.
    StripPlanner(SampleRandom& random, std::string prefix, int firstStrip,
                 int* projectNext = nullptr);
    // The next `count` terminals, strips continuing where the last call stopped.
    std::vector<PlannedTerminal> plan(int count);

private:
    void startStrip();

    SampleRandom& random_;  // jumper groups stay inside one plan() call
    std::string prefix_;
    int stripIndex_;
    std::string stripName_;
    int left_ = 0;          // terminals left on the current strip
    int next_ = 1;          // next number on it
    int jumperLeft_ = 0;    // members of the current jumper group still to place
    int jumperGroups_ = 0;  // groups so far: how the next one writes its texts
    int* projectNext_;      // the project's next number, when numbers run on
};

}  // namespace zvsample
