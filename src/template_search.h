// Finds a template given by name rather than by path: the folders of PINFORGE_TEMPLATE_PATH,
// the installed templates beside the executable, then the source tree's templates/ for a
// binary that runs from its build folder.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

/// The folders a template name is looked up in, in search order: each non-empty folder of
/// PINFORGE_TEMPLATE_PATH (':'-separated, ';' on Windows), `../share/pinforge/templates`
/// relative to the executable, and the source tree's `templates/` when the executable lives
/// inside the build tree it was built in. Folders that do not exist are included.
std::vector<std::string> templateFolders();

/// The file `-template name` reads: `name` itself when anything exists at that path (so a
/// folder or an unreadable file still fails with its own reason), else the first of `name`,
/// `name.tmpl` and `name.tcl` that is a regular file in a folder of templateFolders(). Empty
/// when there is none.
std::optional<std::string> findTemplate(std::string_view name);

/// The names the search finds, sorted and without duplicates: each regular file of the
/// template folders, with a trailing ".tmpl" or ".tcl" removed (so "port_table.tcl" is
/// "port_table"). Files whose names begin with a dot are left out.
std::vector<std::string> availableTemplates();
