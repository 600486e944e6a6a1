// Text about an export for `zelcc info`.
#pragma once

#include <string>
#include <vector>

#include "frame/descriptor.h"

namespace zel::tool {

// "StatusOk", "StatusSizeError" ...; unknown values as "Status(-1000)".
std::string statusName(int status);

// Arguments in prototype order, both sides' formats, layouts, sample types
// and chroma subsampling, steps, family arguments with defaults and
// rejected values, size minima, warnings and the order of checks.
std::string describeExport(const meta::Descriptor& d);

// Every export in table order as one Markdown table: arguments, sides,
// steps, minima, family arguments and the order of checks.
std::string exportsMarkdown();
// The checks the table lists: the order less the plane-entry step of
// members without plane arrays.
std::vector<const meta::CheckStage*> shownChecks(const meta::Descriptor& d);

// The library's version record, for the version query and --version.
std::string describeVersion();

}  // namespace zel::tool
