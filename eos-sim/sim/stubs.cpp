// Functions the simulator does not model yet: Friends, Presence, UI, Achievements, Ecom and the
// external-account mappings of Connect. Each records its call; async ones complete with
// EOS_NotImplemented inside EOS_Platform_Tick, sync ones return it (or a null/zero value).
// Replace a group by moving it into its own file (friends.cpp, ...) with real behaviour.
#include "sim_internal.h"

using namespace eos_sim::sim;

namespace {

const EOS_EResult kNotImplemented = EOS_EResult::EOS_NotImplemented;

template <class T>
json version_of(const T* options) {
    return options ? json({{"ApiVersion", options->ApiVersion}}) : json(nullptr);
}

}  // namespace
