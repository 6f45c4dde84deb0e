#pragma once
// CForms: the class a host creates to open the editors over a quote's
// record set of items. It holds no state of its own: the editors and the
// component's flags live once per thread (component_state.hpp), created on
// first use and reused by every later call on the same thread.
//
// Each Show call blocks until the estimator has closed the editor. A
// failure inside an editor reaches the host as belvane::Error from the call.

#include "data/recordset.hpp"
#include "data/value.hpp"
#include "host/component_state.hpp"

#include <string>

namespace belvane {

class CForms {
public:
  // Opens the labour editor modally over `prsLab` (the host's record set:
  // the editor reads and writes this very object). `psSchedType` ("NRMA",
  // "MTA", "3RD" or "CP") comes back holding the schedule selected when the
  // editor closed. Returns 0.
  long ShowLabourForm(data::RecordsetPtr& prsLab, std::string& psSchedType,
                      const std::string& psQuoteNo, const std::string& psSubQuoteNo,
                      const std::string& psMake, const std::string& psModelID,
                      const std::string& psBodyID, const std::string& psSchedID,
                      const std::string& psMTAID, const std::string& psThirdID, double pdRRRate,
                      double pdRARate, double pdPTRate, bool pbDefaultSched, bool pbInsurerChanged,
                      EQuoteEditMode peMode);

  // While the labour editor is loaded (a call made during its session),
  // writes its lines into the record set; otherwise does nothing. Never
  // loads the editor. Returns 0.
  long SaveLabourChanges();

  // Opens the parts editor modally over `prsParts` (the host's record set
  // of parts: the editor reads and writes this very object), with the
  // quote's vehicle and the current and previous markup percentages of new,
  // used (also exchange), recore and after-market parts. Returns an empty
  // value (Null).
  data::Value ShowPartsForm(data::RecordsetPtr& prsParts, const std::string& psQtnNo,
                            const std::string& psSubQuoteNo, const std::string& psMake,
                            const std::string& psModelID, const std::string& psBodyID,
                            double pdNewMarkup, double pdUsedMarkup, double pdRecoreMarkup,
                            double pdAfterMarketMarkup, double pdOldNewMarkup,
                            double pdOldUsedMarkup, double pdOldRecoreMarkup,
                            double pdOldAfterMarketMarkup, EQuoteEditMode peMode);

  // While the parts editor is loaded (a call made during its session),
  // writes its parts into the record set; otherwise does nothing. Never
  // loads the editor. Returns 0.
  long SavePartsChanges();
};

} // namespace belvane
