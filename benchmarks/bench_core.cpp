#include <benchmark/benchmark.h>

#include "core/numeric.h"
#include "core/pulsed_module.h"
#include "core/timing_solver.h"

namespace {

void BM_GeneralText(benchmark::State& state) {
    double v = 9.444444444444445e-6;
    for (auto _ : state) {
        benchmark::DoNotOptimize(zp::generalText(v));
        benchmark::ClobberMemory();
    }
}
BENCHMARK(BM_GeneralText);

void BM_ParseNumber(benchmark::State& state) {
    for (auto _ : state) {
        benchmark::DoNotOptimize(zp::parseNumber(" -2.5E-07 "));
    }
}
BENCHMARK(BM_ParseNumber);

void BM_SNormalizeValue(benchmark::State& state) {
    double v = 0.0012341;
    for (auto _ : state) {
        benchmark::DoNotOptimize(zp::SNormalizeValue(v, true));
    }
}
BENCHMARK(BM_SNormalizeValue);

void BM_DefaultSolveExternal(benchmark::State& state) {
    auto solver = zp::makeDefaultSolver();
    for (auto _ : state) {
        double prf = 5000;
        std::int32_t ifCount = 0;
        std::int32_t ifbwHz = 3000;
        double offset = 0;
        double delay = 0;
        solver->SolveExternal(prf, ifCount, ifbwHz, offset, delay, 0, zp::kTrue, zp::kTrue);
        benchmark::DoNotOptimize(prf);
        benchmark::DoNotOptimize(ifbwHz);
    }
}
BENCHMARK(BM_DefaultSolveExternal);

void BM_FillAtStartup(benchmark::State& state) {
    const zp::AnalyzerIdentity id{"KT655A", "K71 M83 M84", zp::Ports{4}, zp::Sources{3}, "5.0"};
    zp::PulsedModule module;
    for (auto _ : state) {
        zp::fillAtStartup(module, id);
        benchmark::DoNotOptimize(module.NumOutputs);
    }
}
BENCHMARK(BM_FillAtStartup);

}  // namespace
