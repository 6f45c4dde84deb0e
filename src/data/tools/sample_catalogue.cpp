#include "data/tools/sample_catalogue.hpp"

#include "cipher/field.hpp"
#include "data/catalogue.hpp"
#include "data/tools/catalogue_writer.hpp"
#include "text/error.hpp"

#include <fmt/core.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <string>
#include <vector>

namespace belvane::data::tools {

namespace {

// splitmix64: the same seed gives the same sequence on every platform (the
// standard distributions do not).
class Rng {
public:
  explicit Rng(std::uint64_t seed) : s_(seed) {}
  std::uint64_t Next() {
    std::uint64_t z = (s_ += 0x9E3779B97F4A7C15ull);
    z = (z ^ (z >> 30)) * 0xBF58476D1CE4E5B9ull;
    z = (z ^ (z >> 27)) * 0x94D049BB133111EBull;
    return z ^ (z >> 31);
  }
  int Below(int n) { return static_cast<int>(Next() % static_cast<std::uint64_t>(n)); }
  bool Chance(int percent) { return Below(100) < percent; }
  // A factor between lo and hi, in hundredths.
  double Factor(double lo, double hi) {
    const int steps = static_cast<int>(std::lround((hi - lo) * 100));
    return lo + Below(steps + 1) / 100.0;
  }

private:
  std::uint64_t s_;
};

struct Make {
  const char* name;
  const char* code; // prefix of catalogue and part numbers
  std::array<const char*, 4> models;
  bool diagram;
};

constexpr std::array<Make, 4> kMakes{{
    {"KESTREL", "KS", {"ALDER", "FERRIN", "ISTRA", "ORIN"}, true},
    {"MARLOW", "MW", {"BRISK", "GALLO", "JARRA", "PASCO"}, false},
    {"ORTEGA", "OR", {"CALYX", "HARROW", "KOVA", "QUILL"}, true},
    {"VANTAR", "VT", {"DELTRA", "LUMEN", "NALO", "RILLA"}, false},
}};

enum class Rear { BootLid, Tailgate };
struct BodyStyle {
  const char* name;
  Rear rear;
};
constexpr std::array<BodyStyle, 5> kBodyStyles{{{"4D SEDAN", Rear::BootLid},
                                                {"5D HATCHBACK", Rear::Tailgate},
                                                {"4D WAGON", Rear::Tailgate},
                                                {"2D COUPE", Rear::BootLid},
                                                {"2D UTILITY", Rear::Tailgate}}};

// --- Labour ------------------------------------------------------------------

struct Panel {
  const char* name;
  double rr;    // base R&R hours
  double paint; // base paint hours
};
constexpr std::array<Panel, 16> kPanels{{
    {"FRONT BUMPER BAR", 1.2, 2.4},
    {"BONNET", 0.8, 3.2},
    {"L/H FRONT GUARD", 1.5, 2.6},
    {"R/H FRONT GUARD", 1.5, 2.6},
    {"L/H FRONT DOOR", 2.2, 3.0},
    {"R/H FRONT DOOR", 2.2, 3.0},
    {"L/H REAR DOOR", 2.0, 2.8},
    {"R/H REAR DOOR", 2.0, 2.8},
    {"L/H QUARTER PANEL", 6.5, 2.9},
    {"R/H QUARTER PANEL", 6.5, 2.9},
    {"REAR BUMPER BAR", 1.1, 2.3},
    {"ROOF PANEL", 9.0, 3.8},
    {"RADIATOR SUPPORT PANEL", 4.5, 1.6},
    {"REAR PANEL", 5.0, 1.8},
    {"L/H SILL PANEL", 4.0, 1.5},
    {"R/H SILL PANEL", 4.0, 1.5},
}};

// Operations on a panel; between them they use every allow mask 0 to 7.
struct Operation {
  const char* suffix;
  int mask;
  double rrFactor, paintFactor;
};
constexpr std::array<Operation, 8> kOperations{{
    {"", 7, 1.0, 1.0},
    {" R&I", 4, 0.5, 0.0},
    {" MOULDING", 5, 0.3, 0.4},
    {" REINFORCEMENT", 6, 0.9, 0.0},
    {" BLEND", 1, 0.0, 0.5},
    {" PDR", 2, 0.0, 0.0},
    {" INSPECT", 0, 0.0, 0.0},
    {" SEAM SEALER", 3, 0.0, 0.3},
}};

constexpr int kOperationCount = static_cast<int>(kPanels.size() * kOperations.size());

// Hours factors of the four schedules (NRMA, MTA, 3RD, CP).
constexpr std::array<double, 4> kScheduleFactor{1.0, 1.08, 0.95, 1.15};

// --- Parts -------------------------------------------------------------------

enum class Sides {
  One,   // "O": one part, no side
  Pair,  // "L" and "R" in the same group
  Sided, // "L" in the L/H group, "R" in the R/H group
  Blank, // "": loose items (clips, sensors)
};
enum class Fits { AnyBody, BootLid, Tailgate };

struct PartTemplate {
  const char* group; // for Sides::Sided, without the "L/H " or "R/H "
  const char* name;
  Sides sides;
  int qty;
  double cost;
  Fits fits = Fits::AnyBody;
};

const std::vector<PartTemplate>& PartTemplates() {
  static const std::vector<PartTemplate> parts = {
      {"FRONT BUMPER", "FRONT BUMPER BAR COVER", Sides::One, 1, 420},
      {"FRONT BUMPER", "FRONT BUMPER REINFORCEMENT", Sides::One, 1, 260},
      {"FRONT BUMPER", "FRONT BUMPER ABSORBER", Sides::One, 1, 85},
      {"FRONT BUMPER", "FRONT BUMPER BRACKET", Sides::Pair, 1, 24},
      {"FRONT BUMPER", "FOG LAMP", Sides::Pair, 1, 135},
      {"FRONT BUMPER", "FRONT BUMPER CLIP", Sides::Blank, 10, 1.2},
      {"FRONT BUMPER", "NUMBER PLATE BRACKET", Sides::One, 1, 18},
      {"BONNET", "BONNET PANEL", Sides::One, 1, 690},
      {"BONNET", "BONNET HINGE", Sides::Pair, 1, 48},
      {"BONNET", "BONNET LATCH", Sides::One, 1, 62},
      {"BONNET", "BONNET STRUT", Sides::Pair, 1, 39},
      {"BONNET", "BONNET INSULATOR", Sides::One, 1, 55},
      {"GRILLE", "RADIATOR GRILLE", Sides::One, 1, 210},
      {"GRILLE", "GRILLE EMBLEM", Sides::One, 1, 45},
      {"FRONT PANEL", "RADIATOR SUPPORT PANEL", Sides::One, 1, 380},
      {"FRONT PANEL", "HEADLAMP ASSEMBLY", Sides::Pair, 1, 520},
      {"FRONT PANEL", "RADIATOR", Sides::One, 1, 340},
      {"FRONT PANEL", "A/C CONDENSER", Sides::One, 1, 295},
      {"FRONT GUARD", "FRONT GUARD PANEL", Sides::Sided, 1, 310},
      {"FRONT GUARD", "FRONT GUARD LINER", Sides::Sided, 1, 65},
      {"FRONT GUARD", "SIDE INDICATOR LAMP", Sides::Sided, 1, 22},
      {"FRONT DOOR", "FRONT DOOR SHELL", Sides::Sided, 1, 890},
      {"FRONT DOOR", "FRONT DOOR OUTER HANDLE", Sides::Sided, 1, 58},
      {"FRONT DOOR", "DOOR MIRROR", Sides::Sided, 1, 240},
      {"FRONT DOOR", "FRONT DOOR MOULDING", Sides::Sided, 1, 75},
      {"FRONT DOOR", "FRONT DOOR GLASS", Sides::Sided, 1, 185},
      {"REAR DOOR", "REAR DOOR SHELL", Sides::Sided, 1, 840},
      {"REAR DOOR", "REAR DOOR OUTER HANDLE", Sides::Sided, 1, 58},
      {"REAR DOOR", "REAR DOOR MOULDING", Sides::Sided, 1, 70},
      {"QUARTER PANEL", "QUARTER PANEL OUTER", Sides::Sided, 1, 760},
      {"QUARTER PANEL", "TAIL LAMP", Sides::Sided, 1, 165},
      {"QUARTER PANEL", "REAR WHEEL ARCH LINER", Sides::Sided, 1, 60},
      {"REAR BUMPER", "REAR BUMPER BAR COVER", Sides::One, 1, 395},
      {"REAR BUMPER", "REAR BUMPER REINFORCEMENT", Sides::One, 1, 240},
      {"REAR BUMPER", "PARKING SENSOR", Sides::Blank, 4, 78},
      {"BOOT LID/TAILGATE", "BOOT LID PANEL", Sides::One, 1, 720, Fits::BootLid},
      {"BOOT LID/TAILGATE", "BOOT LID BADGE", Sides::One, 1, 32, Fits::BootLid},
      {"BOOT LID/TAILGATE", "TAILGATE PANEL", Sides::One, 1, 980, Fits::Tailgate},
      {"BOOT LID/TAILGATE", "TAILGATE STRUT", Sides::Pair, 1, 44, Fits::Tailgate},
      {"ROOF", "ROOF PANEL", Sides::One, 1, 1150},
      {"ROOF", "ROOF RACK RAIL", Sides::Pair, 1, 130, Fits::Tailgate},
      {"WINDSCREEN", "WINDSCREEN GLASS", Sides::One, 1, 460},
      {"WINDSCREEN", "WINDSCREEN MOULDING", Sides::One, 1, 38},
      {"WINDSCREEN", "WIPER ARM", Sides::Pair, 1, 36},
  };
  return parts;
}

// Parts past the first pass over the templates are variants of them.
constexpr std::array<const char*, 6> kVariants{" (SPORT)",  " (PREMIUM)", " (BASE)",
                                               " (CHROME)", " (LED)",     " (HEAVY DUTY)"};

// The number plate bracket differs between states: state 1 sells one, state
// 2 another, and neither appears in the other state.
constexpr const char* kRegionalPart = "NUMBER PLATE BRACKET";

struct GeneralItem {
  const char* itemNo;
  const char* script;
  const char* category;
  const char* side;
  const char* group;
};
constexpr std::array<GeneralItem, 14> kGeneralItems{{
    {"G100", "PAINT AND MATERIALS", "PRT", "", "SUNDRIES"},
    {"G101", "CLIPS AND FASTENERS", "PRT", "", "SUNDRIES"},
    {"G102", "SEAM SEALER AND ADHESIVE", "PRT", "", "SUNDRIES"},
    {"G103", "WINDSCREEN URETHANE KIT", "PRT", "O", "WINDSCREEN"},
    {"G104", "BUMPER CLIP SET", "PRT", "O", "FRONT BUMPER"},
    {"G105", "BATTERY 12V", "PRT", "O", "FRONT PANEL"},
    {"G106", "WHEEL NUT", "PRT", "", "WHEELS"},
    {"G107", "BADGE ADHESIVE TAPE", "PRT", "", "SUNDRIES"},
    {"G108", "CORROSION PROTECTION", "PRT", "", "SUNDRIES"},
    {"G109", "HAZARDOUS WASTE DISPOSAL", "PRT", "", "SUNDRIES"},
    {"G110", "HEADLAMP GLOBE", "PRT", "O", "FRONT PANEL"},
    {"S200", "WHEEL ALIGNMENT", "SUB", "", "SUBLET"},
    {"S201", "AIR CONDITIONING REGAS", "SUB", "", "SUBLET"},
    {"M300", "SCAN TOOL DIAGNOSIS", "MEC", "", "MECHANICAL"},
}};

// --- Helpers -----------------------------------------------------------------

// Rounds to `decimals` places; dividing by a power of ten gives the double
// nearest the decimal value (1.2, not 1.2000000000000002).
double RoundTo(double value, int decimals) {
  const double scale = std::pow(10.0, decimals);
  return std::round(value * scale) / scale;
}

// A number as the enciphered hours hold it: '.' as the decimal point, no
// grouping, whatever the locale.
std::string PlainNumber(double value) {
  std::array<char, 32> buf{};
  auto [end, ec] = std::to_chars(buf.data(), buf.data() + buf.size(), value);
  (void)ec;
  return std::string(buf.data(), end);
}

struct Model {
  int index;
  int32_t id;
  const Make* make;
  std::string name, catNo, nrmaId, mtaId, thirdId;
  std::vector<std::pair<std::string, const BodyStyle*>> bodies;
  double factor; // hours and prices of this model against the base
};

class Generator {
public:
  Generator(CatalogueWriter& writer, const SampleOptions& options)
      : w_(writer), o_(options), rng_(options.seed) {}

  SampleSummary Run() {
    Insert("cinfo", {Value(int16_t{1}), Value("Belvane sample catalogue"), Value("2026-01")});
    for (const Make& make : kMakes)
      if (make.diagram) Insert("DIAGRAM_MAKE", {Value(make.name)});
    for (const GeneralItem& g : kGeneralItems)
      Insert("ITEM_2",
             {Value(g.itemNo), Value(g.script), Value(g.category), Value(g.side), Value(g.group)});
    for (int i = 0; i < o_.models; ++i) {
      Model m = MakeModel(i);
      WriteModel(m);
      for (long schedule = 0; schedule < 4; ++schedule)
        WriteSchedule(m, schedule);
      WriteParts(m);
    }
    return summary_;
  }

private:
  void Insert(const char* table, std::vector<Value> row) {
    w_.Insert(table, row);
    ++summary_[table];
  }

  Model MakeModel(int i) {
    Model m;
    m.index = i;
    m.id = 1001 + i;
    m.make = &kMakes[static_cast<size_t>(i) % kMakes.size()];
    const size_t round = static_cast<size_t>(i) / kMakes.size();
    m.name = m.make->models[round % m.make->models.size()];
    if (round >= m.make->models.size()) m.name += " " + std::to_string(round / 4 + 1);
    m.catNo = fmt::format("{}{}", m.make->code, 100 + i);
    m.nrmaId = fmt::format("N{:05}", 20000 + 7 * i);
    m.mtaId = fmt::format("M{:05}", 30000 + 11 * i);
    m.thirdId = fmt::format("T{:05}", 40000 + 13 * i);
    const int bodyCount = 2 + rng_.Below(2);
    const int firstStyle = rng_.Below(static_cast<int>(kBodyStyles.size()));
    for (int b = 0; b < bodyCount; ++b)
      m.bodies.emplace_back(std::to_string(m.id * 10 + b + 1),
                            &kBodyStyles[static_cast<size_t>(firstStyle + b) % kBodyStyles.size()]);
    m.factor = rng_.Factor(0.85, 1.25);
    return m;
  }

  void WriteModel(const Model& m) {
    const int from = 2006 + (m.index * 3) % 15;
    Insert("ALLMODEL",
           {Value(m.id), Value(m.make->name), Value(m.name),
            Value(fmt::format("S{}", 1 + m.index % 3)), Value(static_cast<int16_t>(from)),
            Value(static_cast<int16_t>(from + 4 + m.index % 3)), Value(m.catNo), Value(m.nrmaId),
            Value(m.mtaId), Value(m.thirdId)});
    for (const auto& [bodyId, style] : m.bodies)
      Insert("BODY", {Value(bodyId), Value(m.id), Value(style->name)});
  }

  // Hours as stored: Null when the operation is not allowed, else a plain
  // number or, for about a third, the enciphered text of the number.
  Value Hours(bool allowed, double hours) {
    if (!allowed) return Value();
    hours = std::max(0.1, RoundTo(hours, 1));
    if (rng_.Chance(35)) return Value(cipher::EncryptField(PlainNumber(hours)));
    return Value(hours);
  }

  void LabourRow(long schedule, const std::string& schedId, const std::string& bodyId,
                 const std::string& itemNo, const std::string& script, int mask, double rr,
                 double paint) {
    Insert("LABOUR_ITEM", {Value(static_cast<int16_t>(schedule)), Value(schedId),
                           bodyId.empty() ? Value() : Value(bodyId), Value(itemNo), Value(script),
                           Hours((mask & 4) != 0, rr), Hours((mask & 1) != 0, paint),
                           Value(static_cast<int16_t>(mask))});
  }

  // Which (panel, operation) pairs a schedule lists: every panel's main
  // operation, then the other operations spread over the panels so that
  // every mask appears. Returned in catalogue order.
  std::vector<std::pair<int, int>> LabourOperations() const {
    std::vector<std::pair<int, int>> ops;
    const int panels = static_cast<int>(kPanels.size());
    for (int p = 0; p < panels && static_cast<int>(ops.size()) < o_.labourItems; ++p)
      ops.emplace_back(p, 0);
    const int others = static_cast<int>(kOperations.size()) - 1;
    // Round j gives operation 1 + r to panel (5j + 3r) mod 16: 5 is prime to
    // 16, so no panel gets the same operation twice.
    for (int k = 0; static_cast<int>(ops.size()) < o_.labourItems; ++k) {
      const int j = k / others, r = k % others;
      ops.emplace_back((5 * j + 3 * r) % panels, 1 + r);
    }
    std::sort(ops.begin(), ops.end());
    return ops;
  }

  void WriteSchedule(const Model& m, long schedule) {
    // How the sample files its schedules: NRMA and CP under the NRMA id, 3RD
    // under the third-party id; MTA under the MTA id except every fourth
    // model, whose MTA items are filed under its NRMA id (so the look-up
    // falls back to the second id); every fifth model has no 3RD items.
    std::string schedId = m.nrmaId;
    if (schedule == kScheduleMta && m.index % 4 != 3) schedId = m.mtaId;
    if (schedule == kScheduleThird) {
      if (m.index % 5 == 4) return;
      schedId = m.thirdId;
    }
    const double f = m.factor * kScheduleFactor[static_cast<size_t>(schedule)];
    for (auto [p, o] : LabourOperations()) {
      const Panel& panel = kPanels[static_cast<size_t>(p)];
      const Operation& op = kOperations[static_cast<size_t>(o)];
      LabourRow(schedule, schedId, "", fmt::format("L{:02}{}", p + 1, o),
                std::string(panel.name) + op.suffix, op.mask,
                panel.rr * op.rrFactor * f * rng_.Factor(0.9, 1.1),
                panel.paint * op.paintFactor * f * rng_.Factor(0.9, 1.1));
    }
    // The rear closure differs between bodies: filed per body.
    if (o_.labourItems == 0) return;
    for (const auto& [bodyId, style] : m.bodies) {
      const bool boot = style->rear == Rear::BootLid;
      LabourRow(schedule, schedId, bodyId, boot ? "L9001" : "L9002", boot ? "BOOT LID" : "TAILGATE",
                7, (boot ? 1.0 : 1.4) * f, (boot ? 2.8 : 3.1) * f);
    }
  }

  void PartRow(const Model& m, const std::string& bodyId, Value state, const std::string& itemNo,
               const std::string& name, const char* side, int qty, double cost,
               const std::string& group) {
    Value partname, script;
    const int shape = rng_.Below(100);
    if (shape < 8) {
      script = Value(name); // no enciphered name: the plain description is used
    } else if (shape < 10) {
      partname = Value("   "); // blank: counts as no name
      script = Value(name);
    } else {
      partname = Value(cipher::EncryptField(name));
    }
    Value partno;
    const int numbered = rng_.Below(100);
    if (numbered < 5) {
      partno = Value("");
    } else if (numbered >= 8) {
      std::string number =
          fmt::format("{}-{:05}-{}{}{:03}", m.make->code, 50000 + rng_.Below(40000),
                      static_cast<char>('A' + rng_.Below(26)), rng_.Below(10), rng_.Below(1000));
      partno = Value(cipher::EncryptField(number));
    } // else Null: never numbered
    Value unitcost;
    if (!rng_.Chance(3)) unitcost = Value(RoundTo(cost * m.factor * rng_.Factor(0.9, 1.1), 2));
    Insert("VEHICLE_PART",
           {Value(m.make->name), Value(m.catNo), bodyId.empty() ? Value() : Value(bodyId),
            std::move(state), Value(itemNo), std::move(partname), std::move(script), Value(side),
            Value(qty), std::move(unitcost), std::move(partno),
            Value(cipher::EncryptField(group))});
  }

  void WriteParts(const Model& m) {
    const auto& templates = PartTemplates();
    int written = 0, seq = 0;
    for (int pass = 0; written < o_.partsPerModel; ++pass) {
      const std::string variant =
          pass == 0 ? ""
          : pass <= static_cast<int>(kVariants.size())
              ? kVariants[static_cast<size_t>(pass - 1)]
              : fmt::format(" (REV {})", pass - static_cast<int>(kVariants.size()) + 1);
      for (const PartTemplate& t : templates) {
        if (written >= o_.partsPerModel) break;
        std::vector<std::string> bodies;
        if (t.fits == Fits::AnyBody) {
          bodies.emplace_back();
        } else {
          for (const auto& [bodyId, style] : m.bodies)
            if ((style->rear == Rear::BootLid) == (t.fits == Fits::BootLid))
              bodies.push_back(bodyId);
        }
        if (bodies.empty()) continue;
        const std::string itemNo = fmt::format("P{:06}", ++seq);
        const std::string name = t.name + variant;
        for (const std::string& bodyId : bodies) {
          if (written >= o_.partsPerModel) break;
          const bool regional = pass == 0 && name == kRegionalPart;
          auto row = [&](const char* side, const std::string& group, Value state,
                         const std::string& partName) {
            if (written >= o_.partsPerModel) return;
            PartRow(m, bodyId, std::move(state), itemNo, partName, side, t.qty, t.cost, group);
            ++written;
          };
          switch (t.sides) {
          case Sides::One:
            if (regional) {
              row("O", t.group, Value(int16_t{1}), name);
              row("O", t.group, Value(int16_t{2}), name + " (EUROPEAN)");
            } else {
              row("O", t.group, Value(), name);
            }
            break;
          case Sides::Pair:
            row("L", t.group, Value(), name);
            row("R", t.group, Value(), name);
            break;
          case Sides::Sided:
            row("L", std::string("L/H ") + t.group, Value(), name);
            row("R", std::string("R/H ") + t.group, Value(), name);
            break;
          case Sides::Blank:
            row("", t.group, Value(), name);
            break;
          }
        }
      }
    }
  }

  CatalogueWriter& w_;
  const SampleOptions& o_;
  Rng rng_;
  SampleSummary summary_;
};

void Check(bool ok, const std::string& what) {
  if (!ok) throw Error(err::kInvalidCall, "Invalid sample option: " + what, "Belvane.Catalogue");
}

} // namespace

int SampleLabourOperationCount() { return kOperationCount; }

SampleSummary WriteSampleCatalogue(CatalogueWriter& writer, const SampleOptions& options) {
  Check(options.models >= 1 && options.models <= 10000, "models must be 1 to 10,000");
  Check(options.partsPerModel >= 0 && options.partsPerModel <= 1000000,
        "parts per model must be 0 to 1,000,000");
  Check(options.labourItems >= 0 && options.labourItems <= kOperationCount,
        "labour items must be 0 to " + std::to_string(kOperationCount));
  return Generator(writer, options).Run();
}

SampleSummary WriteSampleCatalogueFile(const std::string& path, const SampleOptions& options) {
  SqliteCatalogueWriter writer(path);
  SampleSummary summary = WriteSampleCatalogue(writer, options);
  writer.Commit();
  return summary;
}

} // namespace belvane::data::tools
