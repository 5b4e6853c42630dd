// The number of the board that a port sits on.
#include "lrmapi/Call.h"

using namespace tvx::sim;

extern "C" {

// Declared in no header: the interface leaves it open, and nothing calls it.
int TvxGetBoardNumber(HBA_WWN wwpn);

int TvxGetBoardNumber(HBA_WWN wwpn) {
  int board = -1;
  port_call("TvxGetBoardNumber", wwpn, [&board](World&, const Port& port, const Fault_Effect&) {
    board = static_cast<int>(port.card);
    return RM_OK;
  });
  return board;
}

}  // extern "C"
