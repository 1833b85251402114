#pragma once
// The timing solver turns the desired timing into a consistent one. Results are written through
// the references; a PRF of 0 on return means that no solution exists. Errors are thrown as
// std::exception.

#include <cstdint>
#include <memory>
#include <vector>

#include "core/bool16.h"

namespace zp {

class TimingSolver {
  public:
    virtual ~TimingSolver() = default;

    virtual void SolveExternal(double& prf, std::int32_t& ifCount, std::int32_t& ifbwHz,
                               double& freqOffset, double& converterDelay, std::int16_t decade,
                               Bool16 fixedPrf, Bool16 flag) = 0;

    virtual void SolveInternal(double& prf, double& ifbw, double& time2, double& time1,
                               double& pulseClockHz, std::vector<std::int32_t>& list1,
                               std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                               Bool16 fixedPrf) = 0;

    virtual void SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                                    double& pulseClockHz, std::vector<std::int32_t>& list1,
                                    std::vector<std::int32_t>& list2,
                                    std::vector<std::int32_t>& list3, Bool16 fixedPrf,
                                    double highestGateDelay, double widestGateWidth,
                                    double& gatedTime1, double& gatedTime2,
                                    std::int32_t& gatedTicks) = 0;

    virtual void SolveReceiver(double prf, double gateWidth, std::int16_t& rxValue) = 0;
};

// Leaves the desired PRF and IF bandwidth as they are and zeroes every further result.
std::unique_ptr<TimingSolver> makePassThroughSolver();

// The narrowband pulsed-detection solver documented in docs/timing-solver.md.
std::unique_ptr<TimingSolver> makeDefaultSolver();

}  // namespace zp
