// Place for SDK functions the simulator does not model yet: each would record its call and
// complete with EOS_NotImplemented inside EOS_Platform_Tick (async) or return it (sync).
// Every function the library calls is modelled today (friends.cpp, presence.cpp, ui.cpp,
// achievements.cpp, ecom.cpp, mappings.cpp), so this file is empty.
#include "sim_internal.h"
