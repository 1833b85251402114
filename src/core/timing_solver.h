#pragma once
// The timing solver turns the desired timing into a consistent one. A solver answers with a
// solution value; a PRF of 0 in it means that no solution exists. Errors are thrown as
// std::exception. The out-parameter forms are the documented call contract (docs/timing-solver.md)
// and only adapt the value forms.

#include <cstdint>
#include <memory>
#include <vector>

#include "core/bool16.h"

namespace zp {

struct ExternalRequest {
    double prf = 0.0;
    std::int32_t ifbwHz = 0;
    double converterDelay = 0.0;
    std::int16_t decade = 0;
    Bool16 fixedPrf = kFalse;
    Bool16 flag = kTrue;
};

struct ExternalSolution {
    double prf = 0.0;  // 0: no solution
    std::int32_t ifCount = 0;
    std::int32_t ifbwHz = 0;
    double freqOffset = 0.0;
    double converterDelay = 0.0;
};

struct InternalRequest {
    double prf = 0.0;
    double ifbw = 0.0;
    double pulseClockHz = 0.0;
    Bool16 fixedPrf = kFalse;
};

// The software gate window of the gated internal path.
struct GateWindow {
    double highestGateDelay = 0.0;
    double widestGateWidth = 0.0;
};

struct GateSolution {
    double time1 = 0.0;  // window delay
    double time2 = 0.0;  // window width
    std::int32_t ticks = 0;
};

struct InternalSolution {
    double prf = 0.0;  // 0: no solution
    double ifbw = 0.0;
    double time1 = 0.0;
    double time2 = 0.0;
    double pulseClockHz = 0.0;
    std::vector<std::int32_t> list1;
    std::vector<std::int32_t> list2;
    std::vector<std::int32_t> list3;
    GateSolution gate;  // set by the gated form only
};

class TimingSolver {
  public:
    virtual ~TimingSolver() = default;

    ExternalSolution SolveExternal(const ExternalRequest& request) { return external(request); }
    InternalSolution SolveInternal(const InternalRequest& request) { return internal(request); }
    InternalSolution SolveInternalGated(const InternalRequest& request, const GateWindow& gate) {
        return internalGated(request, gate);
    }

    // The out-parameter forms: inputs are read from the references, every result is written.
    void SolveExternal(double& prf, std::int32_t& ifCount, std::int32_t& ifbwHz, double& freqOffset,
                       double& converterDelay, std::int16_t decade, Bool16 fixedPrf, Bool16 flag);

    void SolveInternal(double& prf, double& ifbw, double& time2, double& time1,
                       double& pulseClockHz, std::vector<std::int32_t>& list1,
                       std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                       Bool16 fixedPrf);

    void SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                            double& pulseClockHz, std::vector<std::int32_t>& list1,
                            std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                            Bool16 fixedPrf, double highestGateDelay, double widestGateWidth,
                            double& gatedTime1, double& gatedTime2, std::int32_t& gatedTicks);

    virtual void SolveReceiver(double prf, double gateWidth, std::int16_t& rxValue) = 0;

  private:
    // What a solver implements.
    virtual ExternalSolution external(const ExternalRequest& request) = 0;
    virtual InternalSolution internal(const InternalRequest& request) = 0;
    virtual InternalSolution internalGated(const InternalRequest& request,
                                           const GateWindow& gate) = 0;
};

// The narrowband pulsed-detection solver documented in docs/timing-solver.md.
std::unique_ptr<TimingSolver> makeDefaultSolver();

}  // namespace zp
