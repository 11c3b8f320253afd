#pragma once

#include <string>
#include <vector>

namespace ControlStream {

/// What a host makes of the text of a frame.
struct VLintReport
{
    /// Why the host would drop the text in silence; empty where it answers.
    std::string Refusal;

    /// What the host would do that whoever wrote the text may not expect, though it answers.
    std::vector<std::string> Warnings;
};

/// Looks at the text of a frame as a host does, and tells what would become of it. The host itself
/// says nothing of a message that it does not take: a device cannot tell that from a lost one.
///
/// Texts made by the functions of Requests.h need no look. [any]
VLintReport LintRequest(const std::string& text);

} // namespace ControlStream
