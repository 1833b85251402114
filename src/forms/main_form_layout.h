#pragma once
// The designed geometry of the main window in twips. Controls inside a frame are placed relative to
// that frame. The five-row design grows by one row pitch when a four-port analyzer needs a sixth
// row; everything below the gate frame moves down by the same amount.

#include "forms/controls.h"

namespace zp::layout {

inline constexpr int kRowPitch = 360;
inline constexpr int kDesignedRows = 5;

// Window.
inline constexpr int kWindowWidth = 5400;
inline constexpr int kWindowHeight = 7240;

// "Desired PRF and IFBW" sits on top, the gate rows below it.
inline constexpr Geometry kPulsedParamsFrame{120, 120, 5040, 1380};
inline constexpr Geometry kGatesFrame{120, 1560, 5040, 2535};

// Gate frame contents.
inline constexpr Geometry kWidthHeading{1800, 240, 1455, 195};
inline constexpr Geometry kDelayHeading{3360, 240, 1455, 195};
inline constexpr int kFirstLabelTop = 540;
inline constexpr int kFirstFieldTop = 480;
inline constexpr Geometry kSourceLabel{120, kFirstLabelTop, 1575, 255};  // row 0: longer caption
inline constexpr int kGateLabelLeft = 840;
inline constexpr int kGateLabelWidth = 855;
inline constexpr int kLabelHeight = 255;
inline constexpr int kWidthFieldLeft = 1800;
inline constexpr int kDelayFieldLeft = 3360;
inline constexpr int kFieldWidth = 1455;
inline constexpr int kFieldHeight = 315;

// "Desired PRF and IFBW" contents: three label/field lines and the Fixed PRF box.
inline constexpr Geometry kPrfLabel{120, 300, 2175, 255};
inline constexpr Geometry kPriLabel{120, 660, 2175, 255};
inline constexpr Geometry kIfbwLabel{120, 1020, 2175, 255};
inline constexpr Geometry kPrfField{2400, 240, kFieldWidth, kFieldHeight};
inline constexpr Geometry kPriField{2400, 600, kFieldWidth, kFieldHeight};
inline constexpr Geometry kIfbwField{2400, 960, kFieldWidth, kFieldHeight};
inline constexpr Geometry kFixedPrfBox{3960, 270, 1000, 255};

// Lower frames.
inline constexpr Geometry kDutyCycleFrame{120, 4200, 2460, 1560};
inline constexpr Geometry kDutyCycleLabel{120, 240, 2220, 1200};
inline constexpr Geometry kPulsedFrame{2700, 4200, 2460, 1560};
inline constexpr Geometry kCalculateButton{240, 300, 975, 375};
inline constexpr Geometry kApplyButton{1320, 300, 975, 375};
inline constexpr Geometry kPulsedBox{240, 900, 1935, 255};

// Bottom button line, left to right.
inline constexpr int kButtonTop = 5880;
inline constexpr int kButtonWidth = 960;
inline constexpr int kButtonHeight = 375;
inline constexpr int kButtonLeft[5] = {120, 1140, 2160, 3180, 4200};

constexpr Geometry gateLabel(int row) {
    const int top = kFirstLabelTop + kRowPitch * row;
    if (row == 0) return {kSourceLabel.left, top, kSourceLabel.width, kSourceLabel.height};
    return {kGateLabelLeft, top, kGateLabelWidth, kLabelHeight};
}
constexpr Geometry widthField(int row) {
    return {kWidthFieldLeft, kFirstFieldTop + kRowPitch * row, kFieldWidth, kFieldHeight};
}
constexpr Geometry delayField(int row) {
    return {kDelayFieldLeft, kFirstFieldTop + kRowPitch * row, kFieldWidth, kFieldHeight};
}

}  // namespace zp::layout
