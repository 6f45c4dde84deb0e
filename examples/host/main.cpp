// A host of the labour editor. It points the component at a catalogue,
// opens the labour editor in edit mode over a new quote and prints the
// labour records the editor wrote into the quote.
//
// There is no desktop here, so the editor runs on the thread's headless
// runtime and a scripted estimator plays the session: a double click on the
// R&R hours of the first schedule item that has any, "2.5", Enter, Close.
//
//   belvane-example-host CATALOGUE NRMA-SCHEDULE-ID [BODY-ID]

#include <belvane/belvane.hpp>

// The scripted estimator (headless sessions only).
#include <belvane/forms/controls.hpp>
#include <belvane/forms/form.hpp>
#include <belvane/forms/keys.hpp>
#include <belvane/forms/simulated_user.hpp>

#include <exception>
#include <iostream>
#include <string>

namespace {

using namespace belvane;

template <class T> T& ControlOf(forms::Form& form, const char* name, int index = -1) {
  auto* control = dynamic_cast<T*>(form.FindControl(name, index));
  if (!control) throw Error(err::kItemNotFound, std::string("no control ") + name, "example host");
  return *control;
}

void Estimator(forms::Form& form) {
  forms::SimulatedUser user;
  auto& schedule = ControlOf<forms::FlexGrid>(form, "FGLabourItems", 0); // NRMA
  constexpr int kItemNo = 0, kRRHours = 2;
  for (int row = 1; row < schedule.Rows(); ++row) {
    if (schedule.TextMatrix(row, kRRHours).empty()) continue;
    std::cout << "Estimator: R&R of item " << schedule.TextMatrix(row, kItemNo) << " ("
              << schedule.TextMatrix(row, kRRHours) << " h in the schedule) set to 2.5\n";
    user.DoubleClickCell(schedule, row, kRRHours);
    user.Type("2.5");
    user.PressKey(forms::keys::kEnter);
    break;
  }
  user.Click(ControlOf<forms::CommandButton>(form, "cmdClose"));
}

} // namespace

int main(int argc, char** argv) {
  if (argc < 3 || argc > 4) {
    std::cerr << "usage: " << argv[0] << " CATALOGUE NRMA-SCHEDULE-ID [BODY-ID]\n";
    return 2;
  }
  const std::string schedId = argv[2];
  const std::string bodyId = argc > 3 ? argv[3] : "";

  data::SetCatalogueLocation(argv[1]);
  data::RecordsetPtr items = data::QuoteStore::NewItemRecordset();
  std::string schedType = "NRMA";

  forms::HeadlessRuntime& runtime = forms::ThreadHeadlessRuntime();
  runtime.QueueModal(Estimator);
  try {
    CForms().ShowLabourForm(items, schedType, "Q1001", "0", "KESTREL", "1001", bodyId, schedId, "",
                            "", 55.0, 60.0, 65.0, /*defaultSched*/ false,
                            /*insurerChanged*/ false, eEdit);
  } catch (const Error& e) {
    std::cerr << "Error " << e.Number() << " from " << e.Source() << ": " << e.Description()
              << '\n';
    return 1;
  } catch (const std::exception& e) {
    std::cerr << "Error: " << e.what() << '\n';
    return 1;
  }

  // The editor reports its own failures (a catalogue it cannot read, say)
  // in message boxes; a handler that failed is recorded too.
  int status = 0;
  for (const auto& m : runtime.Messages()) {
    std::cerr << "Message box \"" << m.title << "\": " << m.prompt << '\n';
    status = 1;
  }
  for (const auto& e : runtime.UnhandledErrors()) {
    std::cerr << "Error in " << e.where << ": " << e.description << '\n';
    status = 1;
  }

  std::cout << "Schedule: " << schedType << '\n';
  data::Recordset& rs = *items;
  std::cout << "Records: " << rs.RecordCount() << '\n';
  if (rs.RecordCount() > 0) {
    for (rs.MoveFirst(); !rs.Eof(); rs.MoveNext()) {
      std::cout << rs.Collect("qtnno").ToText() << '/' << rs.Collect("subquote").ToText() << ' '
                << rs.Collect("itemno").ToText() << " \"" << rs.Collect("script").ToText() << "\" "
                << rs.Collect("Category").ToText() << " rrhour=" << rs.Collect("rrhour").ToText()
                << " rr_rate2=" << rs.Collect("rr_rate2").ToText()
                << " tag=" << rs.Collect("tag").ToText()
                << " DELITEM=" << rs.Collect("DELITEM").ToText() << '\n';
    }
  }
  return status;
}
