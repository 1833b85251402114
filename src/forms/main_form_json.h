#pragma once
// The main window's state as one JSON object keyed by control name, with what the status line says
// under "status" and the pulse setup state under "state". The command-line front end prints it for
// its `show` action.

#include <string>

namespace zp {

class MainForm;

std::string mainFormJson(const MainForm& form);

}  // namespace zp
