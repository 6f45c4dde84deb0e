#include "entry/cforms.hpp"

#include "labour/frm_labour.hpp"
#include "parts/frm_parts.hpp"

namespace belvane {

long CForms::ShowLabourForm(data::RecordsetPtr& prsLab, std::string& psSchedType,
                            const std::string& psQuoteNo, const std::string& psSubQuoteNo,
                            const std::string& psMake, const std::string& psModelID,
                            const std::string& psBodyID, const std::string& psSchedID,
                            const std::string& psMTAID, const std::string& psThirdID,
                            double pdRRRate, double pdRARate, double pdPTRate, bool pbDefaultSched,
                            bool pbInsurerChanged, EQuoteEditMode peMode) {
  labour::LabourForm().SetQuoteNo(prsLab, psSchedType, psQuoteNo, psSubQuoteNo, psMake, psModelID,
                                  psBodyID, psSchedID, psMTAID, psThirdID, pdRRRate, pdRARate,
                                  pdPTRate, pbDefaultSched, pbInsurerChanged, peMode);
  return 0;
}

long CForms::SaveLabourChanges() {
  if (host::gbLabourFormLoaded) labour::LabourForm().SaveChanges();
  return 0;
}

data::Value CForms::ShowPartsForm(data::RecordsetPtr& prsParts, const std::string& psQtnNo,
                                  const std::string& psSubQuoteNo, const std::string& psMake,
                                  const std::string& psModelID, const std::string& psBodyID,
                                  double pdNewMarkup, double pdUsedMarkup, double pdRecoreMarkup,
                                  double pdAfterMarketMarkup, double pdOldNewMarkup,
                                  double pdOldUsedMarkup, double pdOldRecoreMarkup,
                                  double pdOldAfterMarketMarkup, EQuoteEditMode peMode) {
  parts::PartsForm().SetQuoteNo(prsParts, psQtnNo, psSubQuoteNo, psMake, psModelID, psBodyID,
                                pdNewMarkup, pdUsedMarkup, pdRecoreMarkup, pdAfterMarketMarkup,
                                pdOldNewMarkup, pdOldUsedMarkup, pdOldRecoreMarkup,
                                pdOldAfterMarketMarkup, peMode);
  return data::Value();
}

long CForms::SavePartsChanges() {
  if (host::gbPartsFormLoaded) parts::PartsForm().SaveChanges();
  return 0;
}

} // namespace belvane
