// belvane-quote: a small desktop quoting application over a quote database,
// the demo host of the component. It shows the quotes with their vehicles,
// opens the labour editor on a quote through CForms and the Qt runtime, and
// stores exactly what changed. File > Open quote database... shows another
// quote database.
//
//   belvane-quote [--catalogue FILE] [--quotes FILE]
//   belvane-quote --demo [--screenshots DIR]     (a scripted session)

#include "data/catalogue.hpp"
#include "data/quote_store.hpp"
#include "forms/runtime.hpp"
#include "qt/qt_runtime.hpp"
#include "quote_window.hpp"
#include "sample_quotes.hpp"
#include "scripted_demo.hpp"
#include "text/error.hpp"

#include <CLI/CLI.hpp>
#include <QApplication>

#include <cstdlib>
#include <filesystem>
#include <iostream>
#include <string>
#include <unistd.h>

#ifndef BELVANE_SAMPLE_CATALOGUE
#define BELVANE_SAMPLE_CATALOGUE ""
#endif

namespace fs = std::filesystem;
using namespace belvane;

namespace {

// The catalogue: the one named, else $BELVANE_CATALOGUE, else the sample
// catalogue the build wrote, else the component's default location.
std::string ChooseCatalogue(const std::string& named) {
  if (!named.empty()) return named;
  if (const char* env = std::getenv("BELVANE_CATALOGUE"); env && *env) return env;
  const std::string sample = BELVANE_SAMPLE_CATALOGUE;
  if (!sample.empty() && fs::exists(sample)) return sample;
  return data::CatalogueLocation();
}

} // namespace

int main(int argc, char** argv) {
  CLI::App cli("Belvane Quote: a desktop quoting application over a quote database, opening "
               "the labour editor on a quote and storing what changed.");
  std::string cataloguePath, quotesPath, screenshots = "belvane-quote-screenshots";
  bool demo = false;
  cli.add_option("--catalogue", cataloguePath,
                 "Catalogue database (default: $BELVANE_CATALOGUE, else the build's sample "
                 "catalogue)")
      ->type_name("FILE");
  cli.add_option("--quotes", quotesPath,
                 "Quote database, created with sample quotes when new (default: quotes.db beside "
                 "the catalogue)")
      ->type_name("FILE");
  cli.add_flag("--demo", demo,
               "Play a short scripted session, print it and save pictures of the windows (on "
               "fresh sample quotes unless --quotes is given)");
  cli.add_option("--screenshots", screenshots, "Folder for the scripted session's pictures")
      ->capture_default_str()
      ->type_name("DIR");
  // Qt's own options (-platform, -style, ...) pass through to Qt. The
  // command line is read before any window exists, so --help works without
  // a display.
  cli.allow_extras();
  CLI11_PARSE(cli, argc, argv);

  QCoreApplication::setAttribute(Qt::AA_ShareOpenGLContexts);
  QApplication app(argc, argv);
  QApplication::setApplicationName("belvane-quote");
  QApplication::setApplicationDisplayName("Belvane Quote");

  try {
    const std::string catalogue = ChooseCatalogue(cataloguePath);
    if (!fs::exists(catalogue)) {
      std::cerr << "belvane-quote: no catalogue at " << catalogue
                << " (build the sample one with `make`, or pass --catalogue FILE)\n";
      return 1;
    }
    data::SetCatalogueLocation(catalogue);
    // The scripted session starts from the sample quotes every time, on a
    // quote database of its own (quotes.db, as the window's caption shows
    // it, in a folder of its own) that goes when it ends.
    struct Scratch {
      fs::path folder;
      ~Scratch() {
        std::error_code ignored;
        if (!folder.empty()) fs::remove_all(folder, ignored);
      }
    } scratch;
    if (quotesPath.empty()) {
      if (demo) {
        scratch.folder =
            fs::temp_directory_path() / ("belvane-quote-demo-" + std::to_string(getpid()));
        fs::remove_all(scratch.folder);
        fs::create_directories(scratch.folder);
        quotesPath = (scratch.folder / "quotes.db").string();
      } else {
        quotesPath = (fs::path(catalogue).parent_path() / "quotes.db").string();
      }
    }
    data::QuoteStore store(quotesPath);
    const int added = quote::AddSampleQuotes(store);
    std::cout << "Catalogue: " << catalogue << "\nQuotes:    " << quotesPath
              << (added ? " (" + std::to_string(added) + " sample quotes added)" : std::string())
              << "\n";

    qt::QtRuntime runtime;
    forms::ScopedRuntime use(runtime);
    quote::QuoteWindow window(store);
    if (demo) return quote::RunScriptedDemo(window, runtime, screenshots, std::cout);
    // The editors open as large, and where, the estimator last left them
    // (the scripted session keeps the design's size, for its pictures).
    runtime.RememberWindowPlaces(qt::QtRuntime::DefaultWindowPlacesFile());
    window.show();
    return QApplication::exec();
  } catch (const Error& e) {
    std::cerr << "belvane-quote: " << e.Description() << " (error " << e.Number() << ")\n";
    return 1;
  }
}
