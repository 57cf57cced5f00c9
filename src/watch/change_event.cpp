// The change record handed to the host: its kind is derived from the monitor's action.
// The record is plain data; copies and moves carry all four fields.
#include "vexil/watch/change_event.h"

#include <utility>

namespace {

std::int32_t TypeOfAction(unsigned action) {
  switch (action) {
    case 1: return 0;
    case 2: return 1;
    case 3: return 3;
    case 4:
    case 5: return 2;
    default: return -1;
  }
}

}  // namespace

xChangeEvent::xChangeEvent(std::string name, unsigned action)
    : type(TypeOfAction(action)), action(action), name(std::move(name)) {}
