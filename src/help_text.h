// What `--help` and `--version` print: the full help (switches, examples, where templates are
// found and which are there) and the program's version.
#pragma once

#include <string>

/// "pinforge <version>\n", the version being the build's project version.
std::string versionText();

/// The text `--help` prints after the usage line: one line per switch, two examples, the
/// template folders in search order and the templates found in them.
std::string helpText();
