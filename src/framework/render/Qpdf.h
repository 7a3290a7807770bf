#pragma once

// libqpdf's headers. Include them through this one: clang 14 rejects qpdf/JSON.hh of qpdf 11 as C++20, because a vector of
// the class that is just being defined is destroyed in it. Nothing of ours uses that class, so its declaration will do.
#ifndef JSON_HH
#define JSON_HH
class JSON;
#endif

#include <qpdf/QPDF.hh>
#include <qpdf/QPDFPageDocumentHelper.hh>
#include <qpdf/QPDFPageLabelDocumentHelper.hh>
#include <qpdf/QPDFWriter.hh>
