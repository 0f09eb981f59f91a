"""What is measured beside what, and the ratio that is asked for: at most, ours to the peer's."""
from dataclasses import dataclass


@dataclass
class Benchmark:
    """Two benchmarks of one program, measured in one run."""
    figure: str
    program: str
    ours: str
    peer_name: str
    peer: str
    asked: float | None = None
    why: str = ""


@dataclass
class Processes:
    """Two programs, each in processes of its own, over files that `DiffBench --write-texts` made. By their processor time, or by
    the memory that they held at most."""
    figure: str
    ours: list
    peer_name: str
    peer: list
    asked: float | None = None
    why: str = ""
    memory: bool = False


SEARCH = "a refined diff compares the changed lines again, as words and as characters, where the peer is done with the lines"
MEMORY_SPEED = "on a long text this is as fast as memchr over the bytes, and the loop takes only some four times as long as that"

BENCHMARKS = [
    Benchmark("opening a book of 10,000 pages", "OpenBookBench", "openBook", "open, read and close of its files", "bareLoop", 1.4,
              "1.34 to 1.48 between runs; beyond the loop's calls it makes the nodes and values of 10,000 pages"),
    Benchmark("the same", "OpenBookBench", "openBook", "that loop with libplist parsing", "bareLoopWithLibplist", 1.0),
    Benchmark("opening a classic document of 2,000 pages", "OpenMarletBench", "openMarlet", "open, read and close of its files",
              "bareLoop", 1.6, "a page takes an open, a look, a read, and two look-ups of directories that may be there, which make 1.7 by "
              "themselves; and its text stays in memory, as UTF-16, where the loop reads all files into one buffer"),
    Benchmark("fetching a page", "FetchPageBench", "fetchPage", "reading its files", "bareFiles"),
    Benchmark("fetching a page, book and pack not given", "FetchPageBench", "fetchPageOpeningTheBook", "opening the book",
              "openBook", 2.0),
    Benchmark("reading a large XML list", "PropertyListBench", "ours/read_xml_large", "libplist", "peers/read_xml_large", 1 / 4),
    Benchmark("reading small XML lists", "PropertyListBench", "ours/read_xml_small", "libplist", "peers/read_xml_small", 1 / 5),
    Benchmark("reading a large binary list", "PropertyListBench", "ours/read_binary_large", "libplist", "peers/read_binary_large",
              1 / 1.8),
    Benchmark("reading small binary lists", "PropertyListBench", "ours/read_binary_small", "libplist", "peers/read_binary_small",
              1 / 2),
    Benchmark("writing a large XML list", "PropertyListBench", "oursWriting/write_xml_large", "libplist",
              "peersWriting/write_xml_large", 1 / 2),
    Benchmark("writing a large binary list", "PropertyListBench", "oursWriting/write_binary_large", "libplist",
              "peersWriting/write_binary_large", 1 / 20),
    Benchmark("an uncontended synchronous lock", "LockBench", "dispatchLock", "two pairs of std::mutex", "twoMutexPairs", 1.0),
    Benchmark("an uncontended read lock", "LockBench", "readerWriterRead", "two pairs of std::shared_mutex", "twoSharedPairs", 1.0),
    Benchmark("finding tags' candidates, text in the cache", "TagScanBench", "candidates/2", "a loop over char16_t", "naiveLoop/2",
              1 / 8, MEMORY_SPEED),
    Benchmark("finding tags' candidates, 100 million units", "TagScanBench", "candidates/0", "a loop over char16_t", "naiveLoop/0",
              1 / 8, MEMORY_SPEED),
    Benchmark("the same", "TagScanBench", "candidates/0", "memchr", "memchrOfBytes/0", 2.0),
    Benchmark("parsing 100 million units without tags", "TagScanBench", "parseStringForTags/0", "a loop over char16_t",
              "naiveLoop/0", 1 / 4, MEMORY_SPEED),
    Benchmark("parsing 100 million units with tags", "TagScanBench", "parseStringForTags/1", "a loop over char16_t", "naiveLoop/1"),
    Benchmark("1 MB of source, 1 % of the lines, refined", "DiffBench", "ours/fewLines", "libgit2, lines", "libgit2/fewLines", 0.4,
              SEARCH),
    Benchmark("merging two such diffs", "DiffBench", "oursMerge", "libgit2", "libgit2Merge"),
    Benchmark("decoding UTF-8, ASCII", "TextBench", "decodeOurs/ascii", "ICU", "decodeICU/ascii", 1 / 5),
    Benchmark("decoding UTF-8, mixed", "TextBench", "decodeOurs/mixed", "ICU", "decodeICU/mixed", 1 / 2,
              "scripts change at random in this text, and what is left is branches that the processor can't foresee"),
    Benchmark("encoding UTF-8, ASCII", "TextBench", "encodeOurs/ascii", "ICU", "encodeICU/ascii", 1 / 3),
    Benchmark("100,000 ranges over 10 MB, ASCII", "TextBench", "convertRanges/ascii", "one u_strToUTF8", "convertOnceWithICU/ascii",
              0.5),
    Benchmark("100,000 ranges over 10 MB, accented", "TextBench", "convertRanges/accented", "one u_strToUTF8",
              "convertOnceWithICU/accented", 1.5),
    Benchmark("100,000 ranges over 10 MB, astral", "TextBench", "convertRanges/astral", "one u_strToUTF8",
              "convertOnceWithICU/astral", 1.5),
    Benchmark("expanding 1,000 files", "ArchiveBench", "marletUnzip", "bsdtar", "bsdtar", 1.0),
    Benchmark("the same", "ArchiveBench", "marletUnzip", "unzip", "unzip", 0.5,
              "a seventh of it is the start of the process, which loads a dozen libraries"),
    Benchmark("expanding with progress", "ArchiveBench", "withProgress", "without", "withoutProgress", 1.01,
              "the two differ by less than this machine's noise; of 15 repetitions in turns the ratio of the medians was 1.00"),
    Benchmark("MD5 of a large file", "DigestBench", "checksumMD5", "OpenSSL over the mapped file", "openSSLMD5", 1.03),
    Benchmark("SHA-1 of a large file", "DigestBench", "dataSHA1", "OpenSSL over the mapped file", "openSSLSHA1", 1.03),
    Benchmark("the command, MD5", "DigestBench", "marletMD5", "md5sum", "md5sum", 1.0),
    Benchmark("the command, SHA-1", "DigestBench", "marletSHA1", "sha1sum", "sha1sum", 1 / 3,
              "nearly all of it is OpenSSL's, as the row of SHA-1 in the process shows"),
    Benchmark("reading JSON into values", "JSONBench", "ours", "simdjson's document", "simdjsonDocument"),
    Benchmark("saving 150 of 5,000 files durably", "SaveBench", "durableSave", "rsync with links, and a sync",
              "copyWithLinksBySync", 0.25, "0.24 to 0.51 between runs, as the disk goes: both wait for its flush, and both link and remove each of the files"),
]


def diff(pair):
    return ["DiffDriver", "diff", f"{pair}.old", f"{pair}.new"]


def git_diff(pair):
    return ["git", "diff", "--no-index", "-U0", f"{pair}.old", f"{pair}.new"]


MERGE = ["DiffDriver", "merge", "base", "left", "right"]
PLISTLIB = "import plistlib; plistlib.load(open('large.xml', 'rb'))"

PROCESSES = [
    Processes("1 MB of source, 1 % of the lines, refined", diff("few"), "git diff", git_diff("few"), 0.35, SEARCH),
    Processes("the same, peak memory", diff("few"), "git diff", git_diff("few"), 1.4, memory=True),
    Processes("every third line, peak memory", diff("third"), "git diff", git_diff("third"), 1.4, memory=True),
    Processes("200,000 lines of ten symbols, peak memory", diff("symbols"), "git diff", git_diff("symbols"), 1.4, memory=True),
    Processes("every third line, refined", diff("third"), "git diff", git_diff("third"), 0.5, SEARCH),
    Processes("every third line, plain", diff("third"), "GNU diff", ["diff", "third.old", "third.new"]),
    Processes("200,000 lines of ten symbols", diff("symbols"), "git diff", git_diff("symbols"), 0.04),
    Processes("one line of 1 MB, 1 % of its words", diff("line"), "git diff by characters", git_diff("characters"), 0.12, SEARCH),
    Processes("merging three texts, both diffs with it", MERGE, "git merge-file", ["git", "merge-file", "-p", "left", "base", "right"],
              0.5, SEARCH),
    Processes("two trees of 5,000 files", ["DiffDriver", "trees", "old", "new"], "diff -rq", ["diff", "-rq", "old", "new"], 0.7,
              "nine tenths of it, and of the peer, are the kernel's, opening and reading 10,000 files"),
    Processes("reading a large XML list", ["PropertyListBench", "--memory", "large.xml"], "python's plistlib",
              ["python3", "-c", PLISTLIB]),
    Processes("a digest", ["marlet", "digest", "large.xml"], "openssl", ["openssl", "md5", "large.xml"]),
]

# Each at three sizes, eight times the one before: pages of a book, lines of a text.
# Documents lie in memory where there is such a file system, since a disk's allocation of files grows faster than their number.
GROWTH = {
    "opening a book": ("opening", 250),
    "scanning for tags": ("scanning", 16000),
    "converting offsets": ("converting", 16000),
    "diffing": ("diffing", 16000),
    "diffing where the search gives up": ("diffingFewSymbols", 16000),
    "diffing two equal paragraphs of Japanese and one": ("diffingParagraphs", 1000),
    "diffing 40 equal lines of accents and 39": ("diffingAccents", 500),
    "merging": ("merging", 16000),
    "merging within paragraphs of Japanese": ("mergingParagraphs", 100),
    "reading a text with references from XML": ("readingReferences", 16000),
    "writing numbers with low zero bits": ("writingNumbers", 16000),
    "filling and emptying a dictionary key by key": ("fillingDictionary", 16000),
    "many keys as JSON": ("printingKeys", 16000),
    "opening a book that lists one page again and again": ("openingRepeats", 2000),
    "making and writing an update": ("packing", 32),
    "applying an update and undoing it": ("applying", 32),
}
EXPONENT_ASKED = 1.1
GROWTH_WHY = ("Where more is seen: blocks beyond 32 MB come as fresh pages from the kernel at each run, which is most of what a merge of long "
              "texts takes: the merged text is one. "
              "Scanning takes little longer than the memory takes to give the text: the smallest lies in the caches, the largest, some "
              "68 MB, doesn't, and between runs the exponent was 0.99 to 1.18. "
              "Memory of the smallest size is hardly more than what the process has anyway.")
