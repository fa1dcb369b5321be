// epinspect on a terminal: what it shows there, what it does not, and how wide.
#include "ProgramTest.h"

namespace {

class OnTerminal : public ProgramTest {
protected:
    OnTerminal() {
        std::string mapped;
        for (std::uint64_t i = 0; i < 100; ++i) mapped += epbuilder::littleEndian(0x8000000000000000 + i, 8);
        write("hundred", EPFileBuilder::map().bytes(24576, mapped).entry(99, 0));
        EPFileBuilder shaded = EPFileBuilder::map();  // 513 cells of 12 entries and one of 4, drawn in rows of 33
        const std::uint64_t mappedOf[] = {0, 1, 3, 4, 7, 8, 11, 12};
        for (std::uint64_t i = 0; i < 8 * 12; ++i) shaded.entry(i, i % 12 < mappedOf[i / 12] ? 1ULL << 63U : 0);
        for (std::uint64_t i = 6156; i < 6160; ++i) shaded.entry(i, 1ULL << 63U);
        write("shaded", shaded);
        write("endless", EPFileBuilder::map().resize(std::uint64_t{1} << 40U));
        write("data", EPFileBuilder::data().resize(24576 + 8));
    }

    /// What a user of UTF-8 sees of it, with the status at the end.
    std::string shown(const std::string& command, unsigned short columns = 80) const {
        return Terminal(columns, script("export LC_ALL=C.UTF-8; " + command)).shown();
    }
};

std::string full(unsigned int cells) { return cells == 0 ? "" : "█" + full(cells - 1); }

}  // namespace

TEST_F(OnTerminal, AChartIsAsWideAsTheTerminal) {
    const std::string legend =
        "One cell: 1 entry\nMapped: · none  ░ <1/3  ▒ <2/3  ▓ most  █ all\n100 entries in 2 runs: ";
    const std::string command = "epinspect map hundred --chart", unmapped = "0 unmapped, 1 hole; 0 vpushed, 0 vpulled";
    EXPECT_TRUE(
        fits(shown(command, 40),
             "  0 |" + full(34) + "|\n 34 |" + full(34) + "|\n 68 |" + full(31) + "·|\nOne cell: 1 entry\n" +
                 "Mapped: · none  ░ <1/3  ▒ <2/3  ▓ most\n        █ all\n100 entries in 2 runs: 99 mapped, 0\n" +
                 "unmapped, 1 hole; 0 vpushed, 0 vpulled,\n0 synced\n=0"));
    EXPECT_TRUE(fits(shown(command), "  0 |" + full(74) + "|\n 74 |" + full(25) + "·|\n" + legend + "99 mapped, " +
                                         unmapped + ", 0\nsynced\n=0"));
    EXPECT_TRUE(fits(shown(command, 0), shown(command)));  // its width is not known
    EXPECT_TRUE(fits(shown(command + " --first 98", 2), " 98 |█|\n 99 |·|\nOne\n…"));
    EXPECT_TRUE(
        fits(shown(command, 200), "  0 |" + full(99) + "·|\n" + legend + "99 mapped, " + unmapped + ", 0 synced\n=0"));
}

TEST_F(OnTerminal, AChartShadesACellByItsShareOfMappedEntries) {
    EXPECT_TRUE(
        fits(shown("epinspect map shaded --chart", 40), "   0 |·░░▒▒▓▓█·…|\n 396 |…\n5940 |…·█|\nOne cell: 12 …"));
    EXPECT_TRUE(fits(shown("LC_ALL=C epinspect map shaded --chart", 40),
                     "   0 |.--++**#.…|\n 396 |…\n5940 |..................#|\nOne cell: 12 entries\n"
                     "Mapped: . none  - <1/3  + <2/3  * most\n        # all\n…"));
}

TEST_F(OnTerminal, NothingDisturbsOrDeceivesTheReader) {
    const std::string name = "\"$(printf 'a\\033[1m\\n\\302\\205\u202e\u2066\u200b\ufeff\u00ad\\377ä')\"";
    const std::string escaped = R"(a\x1b[1m\x0a\xc2\x85\xe2\x80\xae\xe2\x81\xa6\xe2\x80\x8b\xef\xbb\xbf\xc2\xad\xffä)";
    EXPECT_EQ(says({escaped + missing}) + "=1", shown("epinspect dump " + name));
    EXPECT_TRUE(fits(shown("cp data " + name + "; epinspect dump data " + name), "data:\n…" + escaped + ":\n…"));
    std::ofstream(path("luns.json")) << R"([{"lid": 7, "extentSize": 1, "size": 1, "restoreTime": 0, "type": 7,
        "uuid": "u", "rootPath": "/v", "name": "\u001b"}])";
    EXPECT_TRUE(fits(shown("export KELPISCSIEP_LUNS=luns.json; epinspect lun 7; epinspect path map 7"),
                     "lid: 7 ,…name: \\x1b\n/v/@iSCSI/LUN/…\\x1b_00000\n/v/@iSCSI/LUN/…\\x1b_00000\n=0"));
}

TEST_F(OnTerminal, BytesAreShownInHexadecimalOnly) {
    EXPECT_EQ("0000000000000000\n=0", shown("epinspect extent data 0 --extent-size 8"));
    EXPECT_EQ("epinspect: --raw: standard output is a terminal. Try 'epinspect extent --help'.\n=2",
              shown("epinspect extent data 0 --extent-size 8 --raw"));
    EXPECT_EQ(says({"standard output is a terminal, not a file or a pipe. Try 'epinspect read --help'."}) + "=2",
              shown("epinspect --root store read 1"));
}

TEST_F(OnTerminal, ProgressIsGoneAfterAnInterruptAndBeforeAMessage) {
    Terminal drawing(80, script("epinspect map endless --chart")),
        listing(80, script("trap '' INT; epinspect map endless >list"));
    Terminal reading(80, script("epinspect read endless --extent-size 1G --offset 90T --length 90T >/dev/null"));
    Terminal entering(80, script("epinspect entry endless 5 0-99999999 >/dev/null"));
    Terminal trying(80, script("KELPISCSIEP_LUNS=none epinspect lun 0-4294967295 --json >none"));
    EXPECT_TRUE(fits(drawing.shownUntil(" left"), "  …%  … of 137438950400 entries, … s left"));
    EXPECT_TRUE(fits(reading.shownUntil(" left"), " …%  … of 98956046499840 bytes, … s left"));
    const std::string entries = entering.shownUntil(" left");  // all that were read, and not the last block of them
    EXPECT_TRUE(fits(entries, "  …%  … of 100000001 entries, … s left") &&
                entries.find(" 4096 of") == std::string::npos);
    EXPECT_TRUE(fits(trying.shownUntil(" left"), "  …% …of 4294967296 LUN ids, … s left"));
    drawing.interrupt();
    EXPECT_TRUE(fits(drawing.shown(), "  …%…\r\033[K=130"));
    listing.shownUntil(" left");
    listing.signal(SIGINT);  // which it has ignored from its start
    std::filesystem::resize_file(path("endless"), 24576);
    EXPECT_TRUE(
        fits(listing.shown(),
             "  …%…\r\033[Kepinspect: endless: entry …: the file has become shorter while it was read (…)\n…=1"));
}

TEST_F(OnTerminal, ThereIsNoProgressBesideAListingNorInAFile) {
    const std::string list = "timeout 2 epinspect map endless & ";
    EXPECT_EQ("=0", shown(list + "timeout 2 epinspect map endless --chart 2>said; wait; cat said"));
}
