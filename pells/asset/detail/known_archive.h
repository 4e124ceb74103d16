#pragma once

#include <istream>
#include <memory>
#include <string>

namespace pells::detail {

/// Opens a member of an archive as pellistream does, but reads the directory of a file that has not
/// changed only once: many pictures may lie in archives with large directories. What is remembered
/// of a file is where the member lies; neither the file nor its directory stays open.
/// Implementation detail; not installed.
///
/// \return a stream that is empty when the archive has no such member.
/// \throws pellibuf::BadPellFile as pellistream does.
std::unique_ptr<std::istream> openKnownMember(const std::string& path, const std::string& member);

}  // namespace pells::detail
