// The sample maker: its store fits together whatever its size, and nothing that is there is touched.
#include "ProgramTest.h"

namespace {

using Epsample = ProgramTest;

// clang-format off
const Case cases[] = {
    {"makes stores that fit together", "epsample plain; epsample tiny --map-entries 0X2ff; "
     "epsample deep/big --map-entries 4198401; for s in plain tiny deep/big; do epinspect check --root $s; done; "
     "cd deep/big; epinspect dump volume*/@iSCSI/EP/EP_TBL | grep 'total count'", 0,
     "11 files, 5376 entries, 0 findings\nSnapshot: …: LUN 3: shares 160 entries with its parent LUN 1, …\n"
     "11 files, 1790 entries, 0 findings\nSnapshot: …: LUN 3: shares 127 entries with …\n"
     "12 files, 4199681 entries, 0 findings\nSnapshot: …: LUN 3: shares 160 entries with its parent LUN 1, …\n"
     "total count:\t\t12582912\ntotal count:\t\t67108864\n", ""},
    {"overwrites nothing", "mkdir full; touch full/x; for d in full full/x full/x/y; do epsample $d; echo $?; done; "
     "ls full", 0, "1\n1\n1\nx\n",
     "epsample: full: not empty, and nothing is overwritten; name a new folder or an empty one\n"
     "epsample: full/x: not a folder\nepsample: full/x/y: Not a directory\n"},
    {"says when a store is not whole", "ulimit -f 100; command epsample cut", 1, "",
     "epsample: cut/…: File too large\nepsample: cut: what has been written is not a whole store\n"},
    {"names wrong usage", "for a in '' 'a b' 'a --map-entries 1x' 'a --map-entries 4294967297' "
     "'a --broken --map-entries 3'; do epsample $a; echo $?; done; epsample ''; echo $?; ls", 0,
     "2\n2\n2\n2\n2\n2\nstore\n",
     "epsample: DIR is missing\nTry 'epsample --help'.\nepsample: 'b': only one DIR is possible\n…"
     "--map-entries: '1x' is not a number from 0 to 4294967296\n…'4294967297' is not a number from 0 to 4294967296\n…"
     "--map-entries and --broken exclude each other\n…epsample: DIR…"},
    {"names an image that may not be read", "echo x >i; chmod 0 i; closed "
     "epsample --disk i d", 1, "",
     "epsample: i: Permission denied\nepsample: d: what has been written is not a whole store\n"},
    {"helps", "epsample -h | head -n 1; epsample --version; epsample --help >/dev/full", 1,
     "Usage: epsample …\nepsample 1.0.0\n", "epsample: standard output: …\n"},
};
// clang-format on

}  // namespace

TEST_P(Epsample, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Epsample, testing::ValuesIn(cases), nameOf);
