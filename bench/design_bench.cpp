// Throughput and fitted complexity of the design operations, over designs
// that the generator makes in memory: build (properties handed to a builder,
// buildTSDesign, then the design deleted), write-back through the annotator,
// trim after withdrawing references, getGroupHolders, and each adversarial
// shape (build; trim after withdrawing its base). Throughput is in bytes of
// property text; the fitted complexity is printed after each family.
//
// Sizes grow by 4 from 256 up to 65536 properties, for the mix and for the
// adversarial shapes alike. TSD_BENCH_MAX_N=1000000 (say) raises the bound.

#include "DesignGen.h"

#include "tsd/Tsd.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <unordered_set>
#include <vector>

namespace {

using tsd_gen::GenDesign;
using tsd_gen::GenLine;
using tsd_gen::LineKind;

// The reference record of one generated element; the line it came from
// outlives it.
class BenchRef : public Tsd_Ref {
public:
    explicit BenchRef(const std::string& element) : m_element(&element) {}
    bool isEqual(const Tsd_Ref* other) const override {
        auto* ref = dynamic_cast<const BenchRef*>(other);
        return ref != nullptr && *ref->m_element == *m_element;
    }
    const std::string& element() const { return *m_element; }

private:
    const std::string* m_element;
};

// Counts what would make a figure meaningless.
class CountingSink : public MessageSink {
public:
    void deliver(const MessageRecord& record) override {
        if (record.severity == MessageSeverity::Error ||
            record.severity == MessageSeverity::Fatal ||
            record.severity == MessageSeverity::InternalError)
            ++errors;
    }
    int errors = 0;
};

struct Built {
    std::unique_ptr<Tsd_Design> design;
    std::vector<BenchRef*> refs; // in input order; the design's objects own them
};

Built build(const GenDesign& gen, CountingSink& sink) {
    ScopedMessageSink scope(&sink);
    Built built;
    Tsd_Builder builder(true);
    for (const GenLine& line : gen.lines) {
        switch (line.kind) {
        case LineKind::Group:
            builder.addUserGroupProp(line.name.c_str(), line.value.c_str());
            break;
        case LineKind::Spec:
            builder.addSpecProp(line.name.c_str(), line.value.c_str());
            break;
        case LineKind::Ref: {
            auto ref = std::make_unique<BenchRef>(line.element);
            if (builder.addRefProp(ref.get(), line.name.c_str(), line.value.c_str()))
                built.refs.push_back(ref.release());
            break;
        }
        case LineKind::Raw:
            break;
        }
    }
    built.design.reset(builder.buildTSDesign());
    return built;
}

std::size_t textBytes(const GenDesign& gen) {
    std::size_t bytes = 0;
    for (const GenLine& line : gen.lines)
        bytes += tsd_gen::lineText(line).size() + 1;
    return bytes;
}

// Withdraws every reference record of the first `count` elements of the
// generator's removal order (all of them for 0).
void withdraw(Built& built, const GenDesign& gen, std::size_t count) {
    if (count == 0 || count > gen.removeOrder.size())
        count = gen.removeOrder.size();
    std::unordered_set<std::string> gone(
        gen.removeOrder.begin(), gen.removeOrder.begin() + static_cast<std::ptrdiff_t>(count));
    for (BenchRef*& ref : built.refs) {
        if (ref != nullptr && gone.count(ref->element()) != 0) {
            ref->trim(); // deletes it
            ref = nullptr;
        }
    }
}

// Everything the annotator writes back, as `tsd fmt` reads it.
std::size_t annotate(Built& built) {
    std::size_t bytes = 0;
    Tsd_Annotator annotator(built.design.get());
    const char* name = nullptr;
    const char* value = nullptr;
    while (annotator.getNextGroupProp(name, value))
        bytes += std::strlen(value);
    while (annotator.getNextSpecProp(name, value))
        bytes += std::strlen(value);
    for (BenchRef* ref : built.refs)
        if (ref != nullptr && annotator.getRefProp(ref, name, value))
            bytes += std::strlen(value);
    return bytes;
}

// The generated design and one build of it, made before the timing starts;
// false (and the benchmark skipped) when it does not build cleanly.
bool prepare(benchmark::State& state, const char* shape, GenDesign& gen, Built& built) {
    gen = tsd_gen::generate(shape, static_cast<std::size_t>(state.range(0)), 1);
    CountingSink sink;
    built = build(gen, sink);
    if (built.design == nullptr || sink.errors != 0) {
        state.SkipWithError("the generated design does not build cleanly");
        return false;
    }
    return true;
}

// The same when only the generated design is wanted.
bool prepare(benchmark::State& state, const char* shape, GenDesign& gen) {
    Built probe;
    return prepare(state, shape, gen, probe);
}

void finish(benchmark::State& state, const GenDesign& gen) {
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) *
                            static_cast<std::int64_t>(textBytes(gen)));
    state.SetComplexityN(state.range(0));
}

void BM_Build(benchmark::State& state, const char* shape) {
    GenDesign gen;
    if (!prepare(state, shape, gen))
        return;
    CountingSink sink;
    for (auto _ : state) {
        Built built = build(gen, sink);
        benchmark::DoNotOptimize(built.design.get());
    }
    finish(state, gen);
}

// Writes the design back; with `trashedFirst`, after every listed element
// was withdrawn and the design trimmed, so that its lists hold trashed
// objects beside the live ones.
void annotateCase(benchmark::State& state, const char* shape, bool trashedFirst) {
    GenDesign gen;
    Built built;
    if (!prepare(state, shape, gen, built))
        return;
    if (trashedFirst) {
        withdraw(built, gen, 0);
        built.design->trim();
    }
    for (auto _ : state)
        benchmark::DoNotOptimize(annotate(built));
    finish(state, gen);
}

void BM_Annotate(benchmark::State& state, const char* shape) {
    annotateCase(state, shape, false);
}

void BM_AnnotateTrashed(benchmark::State& state, const char* shape) {
    annotateCase(state, shape, true);
}

// Withdraws the first 1/divisor of the removal order (all of it for 0) and
// trims; the build and the deletion are not timed.
void trimCase(benchmark::State& state, const char* shape, std::size_t divisor) {
    GenDesign gen;
    if (!prepare(state, shape, gen))
        return;
    CountingSink sink;
    std::size_t count =
        divisor == 0 ? 0 : std::max<std::size_t>(1, gen.removeOrder.size() / divisor);
    for (auto _ : state) {
        state.PauseTiming();
        Built built = build(gen, sink);
        state.ResumeTiming();
        withdraw(built, gen, count);
        benchmark::DoNotOptimize(built.design->trim());
        state.PauseTiming();
        built = Built();
        state.ResumeTiming();
    }
    finish(state, gen);
}

void BM_Trim(benchmark::State& state, const char* shape) {
    trimCase(state, shape, 50); // a fiftieth of the elements, whole groups
}

void BM_TrimBase(benchmark::State& state, const char* shape) {
    trimCase(state, shape, 0);
}

// The holders of one group of each class that the mix always has.
void BM_Holders(benchmark::State& state, const char* shape) {
    GenDesign gen;
    Built built;
    if (!prepare(state, shape, gen, built))
        return;
    Tsd_Design& design = *built.design;
    std::vector<Tsd_Group*> groups = {
        design.findGroupByUserName("grp_dma_0", false),
        design.findGroupByUserName("core0_regs0", false),
        design.findGroupByUserName("tp_pcie_mux0", false),
        design.findClockGroupByNetName("usb_clk0", false),
        design.findTIGByTSid("TS1", false),
    };
    for (Tsd_Group* group : groups) {
        if (group == nullptr) {
            state.SkipWithError("a group the mix always has is missing");
            return;
        }
    }
    for (auto _ : state) {
        for (Tsd_Group* group : groups) {
            Tsd_BaseObjList holders;
            design.getGroupHolders(group, &holders);
            benchmark::DoNotOptimize(holders.getCount());
        }
    }
    finish(state, gen);
}

std::size_t maxN(std::size_t fallback) {
    const char* text = std::getenv("TSD_BENCH_MAX_N");
    if (text == nullptr || *text == '\0')
        return fallback;
    char* end = nullptr;
    unsigned long long value = std::strtoull(text, &end, 10);
    return *end == '\0' && value >= 256 ? static_cast<std::size_t>(value) : fallback;
}

// Each trim needs a fresh design, built with the timing paused; the
// iterations are counted, or the untimed builds would take the run over.
void add(const char* name, void (*fn)(benchmark::State&, const char*), const char* shape,
         std::size_t max, bool untimedSetup = false) {
    std::string full = std::string(name) + "/" + shape;
    auto* bench = benchmark::RegisterBenchmark(full.c_str(), fn, shape)
                      ->RangeMultiplier(4)
                      ->Range(256, static_cast<std::int64_t>(max))
                      ->Complexity(benchmark::oAuto)
                      ->Unit(benchmark::kMillisecond);
    if (untimedSetup)
        bench->Iterations(5);
}

} // namespace

int main(int argc, char** argv) {
    std::size_t mixMax = maxN(65536);
    std::size_t shapeMax = maxN(65536);
    add("Build", BM_Build, "mix", mixMax);
    add("Annotate", BM_Annotate, "mix", mixMax);
    add("Trim", BM_Trim, "mix", mixMax, true);
    add("Holders", BM_Holders, "mix", mixMax);
    for (const char* shape : {"group-chain", "group-chain-rev", "tsid-chain", "tsid-chain-rev",
                              "wide-group", "tnm-refs", "trashed"}) {
        add("Build", BM_Build, shape, shapeMax);
        add("TrimBase", BM_TrimBase, shape, shapeMax, true);
    }
    add("AnnotateTrashed", BM_AnnotateTrashed, "trashed", shapeMax);

    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv))
        return 1;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
