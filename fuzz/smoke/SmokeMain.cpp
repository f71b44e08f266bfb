//===-- fuzz/smoke/SmokeMain.cpp - a fuzz target as an ordinary test program ----===//
//
// Feeds every file of a seed corpus to the target as it is, then a fixed number of
// mutations of those seeds (bit flips, byte changes, cuts, insertions, splices) drawn
// from a fixed seed. No coverage feedback: this catches a target that stops building or
// crashes on its seeds or near them, the same way on every run and with any compiler.
//
//   fuzz_keyfile_smoke fuzz/corpus/fuzz_keyfile [runs]
//
// Exit status: 0 when every input returned, 2 for bad usage or an empty corpus; a fault
// in the target ends the program as it would under libFuzzer (abort, sanitizer report).
//
//===------------------------------------------------------------------------------===//
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <random>
#include <string>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace {

using Bytes = std::vector<std::uint8_t>;

// Bytes that the readers under test give a meaning to.
constexpr std::uint8_t kInteresting[] = {0,   '\n', '\r', ' ', '"', '#', ',',  ':',  ';',
                                         '=', '-',  '.',  '0', '9', 'A', '\\', 0x7f, 0xff};
constexpr std::size_t kMaxInput = 1 << 16;

std::vector<Bytes> ReadCorpus(const std::filesystem::path& folder) {
    std::vector<std::filesystem::path> files;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        if (entry.is_regular_file()) {
            files.push_back(entry.path());
        }
    }
    // Sorted, so that the mutations depend on the corpus alone, not on the directory order.
    std::sort(files.begin(), files.end());
    std::vector<Bytes> corpus;
    for (const auto& file : files) {
        std::ifstream in(file, std::ios::binary);
        corpus.emplace_back(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
    }
    return corpus;
}

// Runs one input from a buffer of exactly its size, so that a sanitizer sees a read past
// its end.
void RunOne(const Bytes& input) {
    const std::unique_ptr<std::uint8_t[]> copy(
        new std::uint8_t[std::max<std::size_t>(input.size(), 1)]);
    std::copy(input.begin(), input.end(), copy.get());
    (void)LLVMFuzzerTestOneInput(copy.get(), input.size());
}

class Mutator {
public:
    explicit Mutator(const std::vector<Bytes>& corpus) : m_corpus(corpus) {}

    Bytes Next() {
        Bytes input = m_corpus[Below(m_corpus.size())];
        const std::size_t steps = 1 + Below(4);
        for (std::size_t i = 0; i < steps; ++i) {
            Mutate(input);
        }
        if (input.size() > kMaxInput) {
            input.resize(kMaxInput);
        }
        return input;
    }

private:
    std::size_t Below(std::size_t n) {
        return n == 0 ? 0 : static_cast<std::size_t>(m_random() % n);
    }

    void Mutate(Bytes& input) {
        const std::size_t at = Below(input.size() + 1);
        switch (Below(7)) {
        case 0: // flip one bit
            if (!input.empty()) {
                input[Below(input.size())] ^= static_cast<std::uint8_t>(1u << Below(8));
            }
            break;
        case 1: // one byte becomes one the readers care about
            if (!input.empty()) {
                input[Below(input.size())] = kInteresting[Below(std::size(kInteresting))];
            }
            break;
        case 2: // cut the end off
            input.resize(Below(input.size() + 1));
            break;
        case 3: // cut a run out of the middle
            if (at < input.size()) {
                const auto first = input.begin() + static_cast<std::ptrdiff_t>(at);
                input.erase(first,
                            first + static_cast<std::ptrdiff_t>(
                                        1 + Below(std::min<std::size_t>(input.size() - at, 16))));
            }
            break;
        case 4: // insert random bytes
            for (std::size_t n = 1 + Below(8); n > 0; --n) {
                input.insert(input.begin() + static_cast<std::ptrdiff_t>(at),
                             static_cast<std::uint8_t>(m_random()));
            }
            break;
        case 5: // repeat a run in place
            if (at < input.size()) {
                const std::size_t length = 1 + Below(std::min<std::size_t>(input.size() - at, 32));
                const Bytes run(input.begin() + static_cast<std::ptrdiff_t>(at),
                                input.begin() + static_cast<std::ptrdiff_t>(at + length));
                input.insert(input.begin() + static_cast<std::ptrdiff_t>(at), run.begin(),
                             run.end());
            }
            break;
        default: { // splice: this input's head, another seed's tail
            const Bytes& other = m_corpus[Below(m_corpus.size())];
            const std::size_t from = Below(other.size() + 1);
            input.resize(at);
            input.insert(input.end(), other.begin() + static_cast<std::ptrdiff_t>(from),
                         other.end());
            break;
        }
        }
    }

    const std::vector<Bytes>& m_corpus;
    std::mt19937_64 m_random{0x5eedf00dULL};
};

} // namespace

int main(int argc, char** argv) {
    if (argc < 2 || argc > 3) {
        std::fprintf(stderr, "usage: %s CORPUS_FOLDER [MUTATIONS]\n", argv[0]);
        return 2;
    }
    const long runs = argc == 3 ? std::strtol(argv[2], nullptr, 10) : 3000;
    std::error_code error;
    if (!std::filesystem::is_directory(argv[1], error)) {
        std::fprintf(stderr, "%s: no corpus folder %s\n", argv[0], argv[1]);
        return 2;
    }
    const std::vector<Bytes> corpus = ReadCorpus(argv[1]);
    if (corpus.empty()) {
        // A target without seeds would only ever see noise: that is a fault of the tree.
        std::fprintf(stderr, "%s: the corpus %s holds no files\n", argv[0], argv[1]);
        return 2;
    }
    for (const Bytes& input : corpus) {
        RunOne(input);
    }
    Mutator mutator(corpus);
    for (long i = 0; i < runs; ++i) {
        RunOne(mutator.Next());
    }
    std::printf("fuzz smoke: %zu seeds and %ld mutations ran\n", corpus.size(), runs);
    return 0;
}
