#pragma once

#include <istream>

#include "bench/xml/receiver.h"

/// \file
/// The same tokens by other means. Each function reads a stream to its end.

namespace bench {

void tokensOfPells(std::istream& in, Receiver& receiver);

/// Copies the events of expat.
void tokensOfExpat(std::istream& in, Receiver& receiver);

// These parse the whole document and walk through it. What is "in memory" reads the stream in
// blocks of its own first; otherwise the parser's own means to read a stream are used, where it has
// any.
void tokensOfPugixml(std::istream& in, Receiver& receiver);
void tokensOfRapidXml(std::istream& in, Receiver& receiver);
void tokensOfRapidXmlInMemory(std::istream& in, Receiver& receiver);
void tokensOfTinyXml2(std::istream& in, Receiver& receiver);

// The library's own grammar in Boost.Spirit Classic.
void tokensOfSpirit(std::istream& in, Receiver& receiver);
void tokensOfSpiritInMemory(std::istream& in, Receiver& receiver);

}  // namespace bench
