// Instances of the test classes as texts: `TEST_Link(Antecedent=TEST_Element(Id=e1), Note=n)`.
#pragma once

#include <string>
#include <string_view>

#include "runtime/Instance.h"

namespace cimrt::test {

/// An instance with the features that the text names; all others are null. A namespace may stand
/// before the class, with a colon between them. Values are texts, numbers, truths, times, nested
/// instances, and in braces lists of texts and of instances. Throws std::logic_error for any other
/// text.
Ref<Instance> object_of(std::string_view text);

/// Makes every feature null, lists of references too.
void empty(Instance* instance);

/// Sets a feature: "Name=value".
void assign(Instance* instance, std::string_view text);

/// The features that are not null, in the order of the class; texts in quotes, lists in braces.
std::string describe(const Instance* instance);

}  // namespace cimrt::test
