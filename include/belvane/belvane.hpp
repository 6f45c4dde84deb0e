#pragma once
// The one header a host includes: CForms and the editing modes, the record
// set the host passes to the editors, the catalogue a host points the
// editors at, the field key a deployment may set, the runtime seam (the
// headless runtime and the simulated user that plays scripted sessions; a
// desktop host installs the Qt runtime), and the quote
// store a host may keep its quotes in.

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "data/recordset.hpp"
#include "data/value.hpp"
#include "entry/cforms.hpp"
#include "forms/controls.hpp"
#include "forms/form.hpp"
#include "forms/keys.hpp"
#include "forms/runtime.hpp"
#include "forms/simulated_user.hpp"
#include "text/error.hpp"
