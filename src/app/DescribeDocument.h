#pragma once

#include "app/Json.h"

class DocumentController;

namespace App
{

/// What is in a document, as `korvane show --json` gives it; docs/handbook describes each key. Lengths are points. For
/// a document that nobody changes meanwhile.
Json DescribeDocument(DocumentController const & document);

}
