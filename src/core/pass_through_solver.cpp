#include "core/timing_solver.h"

namespace zp {

namespace {

// Keeps the desired timing; lets the rest of the program run without a real solver.
class PassThroughSolver final : public TimingSolver {
  public:
    void SolveExternal(double&, std::int32_t& ifCount, std::int32_t&, double& freqOffset, double&,
                       std::int16_t, Bool16, Bool16) override {
        ifCount = 0;
        freqOffset = 0.0;
    }

    void SolveInternal(double&, double&, double& time2, double& time1, double&,
                       std::vector<std::int32_t>& list1, std::vector<std::int32_t>& list2,
                       std::vector<std::int32_t>& list3, Bool16) override {
        time1 = 0.0;
        time2 = 0.0;
        list1.clear();
        list2.clear();
        list3.clear();
    }

    void SolveInternalGated(double& prf, double& ifbw, double& time2, double& time1,
                            double& pulseClockHz, std::vector<std::int32_t>& list1,
                            std::vector<std::int32_t>& list2, std::vector<std::int32_t>& list3,
                            Bool16 fixedPrf, double, double, double& gatedTime1, double& gatedTime2,
                            std::int32_t& gatedTicks) override {
        SolveInternal(prf, ifbw, time2, time1, pulseClockHz, list1, list2, list3, fixedPrf);
        gatedTime1 = 0.0;
        gatedTime2 = 0.0;
        gatedTicks = 0;
    }

    void SolveReceiver(double, double, std::int16_t& rxValue) override { rxValue = 0; }
};

}  // namespace

std::unique_ptr<TimingSolver> makePassThroughSolver() {
    return std::make_unique<PassThroughSolver>();
}

}  // namespace zp
