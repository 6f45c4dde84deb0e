#include "grid/observable.hpp"

#include <algorithm>

namespace belvane::grid {

Observable::~Observable() {
  auto observers = observers_;
  for (ModelObserver* o : observers)
    if (o) o->ModelDestroyed();
}

void Observable::AddObserver(ModelObserver* observer) {
  if (!observer || std::find(observers_.begin(), observers_.end(), observer) != observers_.end())
    return;
  observers_.push_back(observer);
  ++live_;
}

void Observable::RemoveObserver(ModelObserver* observer) {
  auto it = std::find(observers_.begin(), observers_.end(), observer);
  if (!observer || it == observers_.end()) return;
  // While notifying, leave a hole so the running loop's indexes stay valid.
  *it = nullptr;
  --live_;
  if (depth_ == 0) Compact();
}

void Observable::Compact() {
  observers_.erase(std::remove(observers_.begin(), observers_.end(), nullptr), observers_.end());
}

} // namespace belvane::grid
