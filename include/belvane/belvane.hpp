#pragma once
// The one header a host includes. It brings the record set the host passes
// to the editors and the quote store a host may keep its quotes in.

#include "data/quote_store.hpp"
#include "data/recordset.hpp"
#include "data/value.hpp"
#include "text/error.hpp"
