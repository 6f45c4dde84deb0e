#pragma once
// The demo's sample quotes: on first run an empty quote database gets a few
// quotes on vehicles of the catalogue, some with labour lines taken from the
// catalogue's NRMA schedule and parts of every type from the vehicle's parts
// catalogue, some priced with the markups in force before.

#include "data/quote_store.hpp"

namespace belvane::quote {

// Fills an empty store with sample quotes on the first vehicle models of
// the catalogue in force. Returns how many quotes it wrote (0 when the store
// has quotes already). Raises belvane::Error when the catalogue cannot be
// read or the store refuses the quotes.
int AddSampleQuotes(data::QuoteStore& store);

} // namespace belvane::quote
