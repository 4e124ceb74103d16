#pragma once

#include <istream>

#include "bench/xml/receiver.h"

/// \file
/// The same tokens by other means. Each function reads a stream to its end.

namespace bench {

void tokensOfPells(std::istream& in, Receiver& receiver);

/// Copies the events of expat.
void tokensOfExpat(std::istream& in, Receiver& receiver);

// These parse the whole document and walk through it.
void tokensOfPugixml(std::istream& in, Receiver& receiver);
void tokensOfRapidXml(std::istream& in, Receiver& receiver);
void tokensOfTinyXml2(std::istream& in, Receiver& receiver);

// The library's own grammar in Boost.Spirit Classic, on iterators over the stream or on the whole
// text in memory.
void tokensOfSpirit(std::istream& in, Receiver& receiver);
void tokensOfSpiritInMemory(std::istream& in, Receiver& receiver);

}  // namespace bench
