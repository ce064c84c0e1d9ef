// Parse throughput of the constraint parsers, in MB/s of constraint text,
// measured beside a plain byte scan of the same buffer in the same run. The
// ratio of the two is printed at the end: it says how many times slower than
// merely touching every byte the parsers are.
#include "tsd/host/LogicalConstraintParser.h"
#include "tsd/host/NetConstraintParser.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

namespace {

// One copy of each form, canonical as the library writes it and as people
// write it by hand; "#" is replaced by a number so names vary.
const char* const kLogicalForms[] = {
    "TIMEGRP grp_#=FFS:RISING:clkgrp_#:EXCEPT:slow_ffs_# ;",
    "TIMEGRP A_#= ;",
    "TIMEGRP ram_pads_#=RAMS:PADS:top/core_#/regs:\"*odd_#\" ;",
    "TIMESPEC TS#01=FROM:ffs_a_#:TO:ffs_b_#:10:nS ;",
    "TIMESPEC TS#03=FROM:pads_#:THRU:t1_#:THRU:t2_#:TO:ffs_#:TS#01/2:DATAPATHONLY ;",
    "TIMESPEC TS#04=FROM:ram_#:TO:pads_#:TIG:PRIORITY:1 ;",
    "TIMESPEC TS#05=PERIOD:clk_#:10:nS:HIGH:50% ;",
    "TIMESPEC TS#06=PERIOD:clk2_#:TS#01*2:PHASE:+:2.5:nS:LOW:4:nS ;",
    "TIMESPEC TS#07=PERIOD:sys_#:100:MHz:INPUT_JITTER:200:pS:PRIORITY:3 ;",
    "TIMESPEC TS#08=PERIOD:\"*odd_#\":10000:pS ;",
    "OFFSET=IN:2:nS:BEFORE:clk_# ;",
    "OFFSET=OUT:5:nS:AFTER:clk_#:TIMEGRP:outregs_# ;",
    "OFFSET=IN:1:nS:VALID:3:nS:BEFORE:clk_#:HIGH ;",
    "TIMEGRP:data_pads_#:OFFSET=IN:2:nS:BEFORE:clk_# ;",
    "TIMEGRP:pads_#:OFFSET=IN:0:BEFORE:clk_#: ;",
    "ENABLE=delay_# ;",
    "DISABLE= ;",
    "TIMESPEC TS#11 = PERIOD \"clk_#\" 10 ns HIGH 50% ;",
    "TIMESPEC TS#12 = FROM a_# THRU t1_# TO b_# TS#01 / 2 ;",
    "OFFSET = IN 2 ns VALID 3 ns BEFORE clk_# ;",
    "TIMEGRP pads_# OFFSET = OUT 1.5 ns AFTER clk_# TIMEGRP regs_# HIGH ;",
    "timespec TS#13 = from a_# to b_# 1e-3 us datapathonly priority 7 ;",
    "TIMEGRP group_# = FFS(data_#*) RISING clocks_# EXCEPT \"slow ffs\" ;",
    "TIMEGRP cpu_addr_# = pads(\"A<*>\") LATCHES (top/\"a b\"/*) \"say \"\"#\"\"\" ;",
    "TIMESPEC TS#14 = FROM FFS(\"*hist_pre_#*\") TO rams (\"*i_huffman_#*\") 5 ns PRIORITY -1 ;",
};

const char* const kNetForms[] = {
    "PERIOD=10000:pS:HIGH:50% ;",
    "PERIOD=8000:pS:LOW:3000:pS:INPUT_JITTER:100:pS ;",
    "MAXDELAY=500:pS ;",
    "MAXSKEW=500:pS ;",
    "OFFSET=IN:2:nS:BEFORE:clk_#:TIMEGRP:regs_#:HIGH ;",
    "FEEDBACK=1500:pS:NET:clkfb_# ;",
    "OFFSET=OUT:0:AFTER:clk_#: ;",
    "PERIOD = 10 ns HIGH 50 ;",
    "OFFSET = OUT 3 AFTER \"clk #\" LOW ;",
    "OFFSET = IN 2 ns BEFORE clk_# TIMEGRP FFS (\"regs_#*\") ;",
};

// Texts packed into one buffer, each ending in its zero, as they would sit
// in a caller's memory.
struct Corpus {
    std::string buffer;
    std::vector<std::size_t> starts;
    std::size_t textBytes = 0;
};

template <std::size_t N>
Corpus makeCorpus(const char* const (&forms)[N], int copies) {
    Corpus c;
    for (int i = 0; i < copies; ++i) {
        for (const char* form : forms) {
            std::string text;
            for (const char* p = form; *p != '\0'; ++p) {
                if (*p == '#')
                    text += std::to_string(i);
                else
                    text += *p;
            }
            c.starts.push_back(c.buffer.size());
            c.buffer += text;
            c.buffer += '\0';
            c.textBytes += text.size();
        }
    }
    return c;
}

const Corpus& logicalCorpus() {
    static const Corpus corpus = makeCorpus(kLogicalForms, 200);
    return corpus;
}
const Corpus& netCorpus() {
    static const Corpus corpus = makeCorpus(kNetForms, 400);
    return corpus;
}

// Every text of the corpus must parse: a benchmark of error paths would
// measure the wrong thing.
template <class Parser>
void checkCorpus(Parser& parser, const Corpus& corpus, const char* what) {
    for (std::size_t start : corpus.starts) {
        if (parser.parse(corpus.buffer.data() + start)) {
            std::fprintf(stderr, "%s corpus text does not parse: %s\n", what,
                         corpus.buffer.data() + start);
            std::exit(1);
        }
    }
}

void BM_ByteScan(benchmark::State& state) {
    const Corpus& corpus = logicalCorpus();
    const auto* bytes = reinterpret_cast<const unsigned char*>(corpus.buffer.data());
    const std::size_t size = corpus.buffer.size();
    for (auto _ : state) {
        // Count the separators: every byte is read and compared once.
        std::size_t separators = 0;
        for (std::size_t i = 0; i < size; ++i)
            separators += bytes[i] == ':' || bytes[i] == ' ';
        benchmark::DoNotOptimize(separators);
    }
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(corpus.textBytes));
}

void BM_LogicalParse(benchmark::State& state) {
    const Corpus& corpus = logicalCorpus();
    LogicalConstraintParser parser;
    checkCorpus(parser, corpus, "logical");
    for (auto _ : state)
        for (std::size_t start : corpus.starts)
            benchmark::DoNotOptimize(parser.parse(corpus.buffer.data() + start));
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(corpus.textBytes));
}

void BM_NetParse(benchmark::State& state) {
    const Corpus& corpus = netCorpus();
    NetConstraintParser parser;
    checkCorpus(parser, corpus, "net");
    for (auto _ : state)
        for (std::size_t start : corpus.starts)
            benchmark::DoNotOptimize(parser.parse(corpus.buffer.data() + start));
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(corpus.textBytes));
}

BENCHMARK(BM_ByteScan);
BENCHMARK(BM_LogicalParse);
BENCHMARK(BM_NetParse);

// Prints as the console reporter does and keeps each run's bytes per second.
class RatioReporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run>& runs) override {
        ConsoleReporter::ReportRuns(runs);
        for (const Run& run : runs) {
            auto it = run.counters.find("bytes_per_second");
            if (!run.error_occurred && it != run.counters.end())
                rates[run.benchmark_name()] = it->second.value;
        }
    }
    std::map<std::string, double> rates;
};

} // namespace

int main(int argc, char** argv) {
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();

    auto scan = reporter.rates.find("BM_ByteScan");
    for (const char* name : {"BM_LogicalParse", "BM_NetParse"}) {
        auto parse = reporter.rates.find(name);
        if (parse == reporter.rates.end())
            continue;
        std::printf("%-16s %8.1f MB/s", name + 3, parse->second / 1e6);
        if (scan != reporter.rates.end() && parse->second > 0)
            std::printf("   byte scan %8.1f MB/s   ratio scan/parse %.1f", scan->second / 1e6,
                        scan->second / parse->second);
        std::printf("\n");
    }
    return 0;
}
