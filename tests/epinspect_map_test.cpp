// epinspect map and entry: the entries of a map file.
#include "ProgramTest.h"

namespace {

class Map : public ProgramCases {
protected:
    Map() { write("five", EPFileBuilder::map().entry(0, 0x9000000000000000).entry(1, 0x9010000000000001).entry(4, 1)); }
};

const Case cases[] = {
    {"every run has a line and the whole a summary", "epinspect map five", 0,
     "0: mapped synced, pool 0, extent 0\n1: mapped synced, pool 16, extent 1\n2-3: hole\n4: unmapped, pool 0, extent "
     "1\n"
     "5 entries in 4 runs: 2 mapped, 1 unmapped, 2 holes; 0 vpushed, 0 vpulled, 2 synced\n",
     ""},
};

}  // namespace

TEST_P(Map, KeepsItsPromise) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Map, testing::ValuesIn(cases), nameOf);
