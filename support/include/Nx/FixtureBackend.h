// The fixture backend of the host model: a node tree kept in a hand-written text file (see
// support/FIXTURES.md for the format).
#pragma once

#include <memory>
#include <string>

#include "Nx/HostModel.h"

namespace Nx {
namespace HostModel {

// Reads the file at once; throws Nx::InstrumentationException ("PATH:LINE: reason") when it cannot
// be read or parsed.
std::shared_ptr<Backend> openFixtureBackend(const std::string& path);

// Parses fixture text; throws Nx::InstrumentationException naming origin and line on an error.
Tree parseFixture(const std::string& text, const std::string& origin);

// Renders a tree in the fixture format (no comments); parseFixture gives the same tree back.
std::string formatFixture(const Tree& tree);

}  // namespace HostModel
}  // namespace Nx
