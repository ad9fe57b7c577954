// The ipif command line: the embedded host's operations, spelt the way wbemcli spells them.
//
// Exit codes: 0 success; 1 the command line was rejected before any request was made (usage,
// a malformed path or value, a class, property or parameter the MOF does not declare, MOF,
// registration or host model files that do not load); 2 a request ended with a CMPI error
// status (also a get that finds no instance, and a namespace the host does not serve); 3 a
// method returned a nonzero ReturnValue. Every error is one line on stderr, control characters
// escaped:
//   ipif: error: rc N (CMPI_RC_...): message     (anything with a CIM status)
//   ipif: error: message                         (usage, host model, ReturnValue)
#pragma once

#include <iosfwd>
#include <string>
#include <vector>

namespace ipif {
namespace cli {

int run(const std::vector<std::string>& args, std::ostream& out, std::ostream& err);

}  // namespace cli
}  // namespace ipif
