#pragma once
// The shown windows of the calling thread, front last, and the stack of
// modal forms (innermost last). Internal to the forms layer.

#include <vector>

namespace belvane::forms {
class Form;
}

namespace belvane::forms::detail {

struct WindowList {
  std::vector<Form*> shown;
  std::vector<Form*> modal;
};

WindowList& Windows();
void Erase(std::vector<Form*>& list, const Form* form);

} // namespace belvane::forms::detail
