#pragma once
// The subcommands of the tool. Each receives the arguments after its name.
#include "Output.hpp"

namespace dexmor {

int runXml(Args args);
int runCheck(Args args);
int runList(Args args);
int runExplain(Args args);

} // namespace dexmor
