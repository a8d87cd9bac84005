#pragma once

#include <memory>
#include <string_view>
#include <vector>

#include "framework/layout/CExpressionScope.h"

namespace Tarsa {

class CViewProxy;
class CZilGenerator;

// The scope of a layout file's block, and the parser of its statements:
// assignments, step and align_centers, and views with their parameters and
// blocks. Logic and sets are on. The generator comes from the parent scope
// when none is given, and a view scope without one is an error. Makes a
// view proxy for each view it meets and hands it to the caller; borrows
// the parent and the generator.
class CSwiftViewScope : public CExpressionScope {
 public:
  // Views nest no deeper than this; statements inside run to the end.
  static constexpr int kMaxNesting = 48;

  explicit CSwiftViewScope(CExpressionScope* parent, CZilGenerator* generator = nullptr);

  CZilGenerator& Generator() const { return *generator_; }

  // Parses statements until the end of the text or a '}', which is left to
  // the caller, and appends the views met to `views`.
  void ParseDefinition(CZilLexer& lexer, std::vector<std::unique_ptr<CViewProxy>>& views,
                       int nesting = 0);

 private:
  struct Value {
    std::int32_t value = kUndefined;
    std::string_view string;
    bool hasString = false;
    std::string_view text;  // as written
  };

  Value ParseValue(CZilLexer& lexer);
  void ParseAssignment(CZilLexer& lexer);
  void ParseStep(CZilLexer& lexer);
  void ParseAlignCenters(CZilLexer& lexer);
  std::unique_ptr<CViewProxy> ParseView(CZilLexer& lexer, int nesting);
  // Fills a proxy's layout fields and properties from the view's own
  // scope; `inner` is the scope its children were read in.
  static void ReadFields(CViewProxy& proxy, const CSwiftViewScope& own,
                         const CExpressionScope& inner);

  CZilGenerator* generator_;
};

}  // namespace Tarsa
