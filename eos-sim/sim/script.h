// The script runner (script.cpp), as the world-file loader sees it.
#pragma once

namespace eos_sim::sim {

// A world was just loaded at EOS_Initialize: the "fail" events due at tick 0 are armed now, so
// that they can hit the calls made before the first tick.
void script_world_loaded();

}  // namespace eos_sim::sim
