#include "framework/layout/CSwiftViewScope.h"

#include <algorithm>
#include <stdexcept>

#include "framework/layout/CViewProxy.h"
#include "framework/layout/CZilGenerator.h"
#include "framework/layout/CZilSyntaxError.h"

namespace Tarsa {
namespace {

CZilGenerator* GeneratorOf(CExpressionScope* parent, CZilGenerator* given) {
  if (given != nullptr) return given;
  for (CExpressionScope* scope = parent; scope != nullptr; scope = scope->Parent()) {
    if (auto* view = dynamic_cast<CSwiftViewScope*>(scope)) return &view->Generator();
  }
  throw std::logic_error("Warning! (fGenerator)");
}

// Sizes and offsets are kept to a range whose sums over any file's tree
// stay within 32 bits.
constexpr std::int32_t kMaxExtent = 65535;
std::int32_t Size(std::int32_t v) { return std::clamp(v, 0, kMaxExtent); }
std::int32_t Offset(std::int32_t v) { return std::clamp(v, -kMaxExtent, kMaxExtent); }

// The properties a view takes from the blocks around it when it does not
// give them itself: the fonts set at the head of a window.
constexpr std::string_view kInherited[] = {"text_font",     "label_font",       "bold_label_font",
                                           "control_font",  "push_button_font", "menu_font",
                                           "menu_bar_font", "control_size"};

}  // namespace

CSwiftViewScope::CSwiftViewScope(CExpressionScope* parent, CZilGenerator* generator)
    : CExpressionScope(parent, true, true), generator_(GeneratorOf(parent, generator)) {}

void CSwiftViewScope::ParseDefinition(CZilLexer& lexer,
                                      std::vector<std::unique_ptr<CViewProxy>>& views,
                                      int nesting) {
  for (;;) {
    const CZilToken token = lexer.Peek();
    if (token.kind == EZilToken::kEnd || lexer.IsPunct("}")) return;
    if (token.kind != EZilToken::kName) {
      lexer.Fail("expected a statement (a name), found " + CZilLexer::Describe(token));
    }
    if (token.text == "step" && lexer.IsPunct("(", 1)) {
      ParseStep(lexer);
    } else if (token.text == "align_centers" && lexer.IsPunct("(", 1)) {
      ParseAlignCenters(lexer);
    } else if (lexer.IsPunct("=", 1)) {
      ParseAssignment(lexer);
    } else if (lexer.IsPunct("(", 1)) {
      views.push_back(ParseView(lexer, nesting));
    } else {
      lexer.Next();
      lexer.Fail("expected '=' or '(' after '" + std::string(token.text.substr(0, 40)) +
                 "', found " + CZilLexer::Describe(lexer.Peek()));
    }
  }
}

CSwiftViewScope::Value CSwiftViewScope::ParseValue(CZilLexer& lexer) {
  Value value;
  const CZilToken first = lexer.Peek();
  const CZilToken after = lexer.Peek(1);
  const bool ends = after.kind == EZilToken::kPunct &&
                    (after.text == "," || after.text == ")" || after.text == ";");
  if (first.kind == EZilToken::kName && ends) {
    // A name alone: the whole symbol, its int and its string.
    lexer.Next();
    const Symbol* symbol = Find(first.text);
    if (symbol == nullptr) {
      throw CZilSyntaxError(first.line,
                            "'" + std::string(first.text.substr(0, 40)) + "' is not defined");
    }
    value.value = symbol->value;
    value.string = symbol->string;
    value.hasString = symbol->hasString;
    value.text = first.text;
    return value;
  }
  if (first.kind == EZilToken::kString && ends) {
    lexer.Next();
    value.string = first.text;
    value.hasString = true;
    if (first.text.size() == 4) {
      // A four-character code, big-endian.
      std::uint32_t code = 0;
      for (const char c : first.text) code = (code << 8) | static_cast<unsigned char>(c);
      value.value = static_cast<std::int32_t>(code);
    }
    value.text = lexer.Text().substr(first.start, first.end - first.start);
    return value;
  }
  value.value = Evaluate(lexer);
  value.text = lexer.Text().substr(first.start, lexer.Peek().start - first.start);
  return value;
}

void CSwiftViewScope::ParseAssignment(CZilLexer& lexer) {
  const std::string_view name = lexer.ExpectName("to assign");
  lexer.Expect("=", "after the name of an assignment");
  const Value value = ParseValue(lexer);
  lexer.Expect(";", "to end the assignment to " + std::string(name.substr(0, 40)));
  DefineSymbol(name, value.value, value.string, value.hasString);
}

void CSwiftViewScope::ParseStep(CZilLexer& lexer) {
  lexer.Next();
  lexer.Expect("(", "after step");
  const std::int32_t first = Evaluate(lexer);
  lexer.Expect(",", "after the first value of step");
  const std::int32_t increment = Evaluate(lexer);
  std::int32_t value = first;
  do {
    lexer.Expect(",", "before each name of step");
    lexer.Expect("&", "before each name of step");
    const std::string_view name = lexer.ExpectName("after '&' in step");
    Define(name, value);
    if (value != kUndefined && increment != kUndefined) {
      value = static_cast<std::int32_t>(static_cast<std::uint32_t>(value) +
                                        static_cast<std::uint32_t>(increment));
    }
  } while (!lexer.IsPunct(")"));
  lexer.Expect(")", "to close step");
  lexer.Expect(";", "after step");
}

void CSwiftViewScope::ParseAlignCenters(CZilLexer& lexer) {
  const int line = lexer.Peek().line;
  lexer.Next();
  lexer.Expect("(", "after align_centers");
  const std::int32_t base = Evaluate(lexer);
  std::vector<std::int32_t> heights;
  while (lexer.Accept(",")) {
    if (lexer.IsPunct("&")) break;
    heights.push_back(Evaluate(lexer));
  }
  std::vector<std::string_view> names;
  while (lexer.Accept("&")) {
    names.push_back(lexer.ExpectName("after '&' in align_centers"));
    if (!lexer.Accept(",")) break;
  }
  lexer.Expect(")", "to close align_centers");
  lexer.Expect(";", "after align_centers");
  if (heights.empty() || names.size() != heights.size()) {
    throw CZilSyntaxError(line, "align_centers needs as many names as heights (" +
                                    std::to_string(heights.size()) + " heights, " +
                                    std::to_string(names.size()) + " names)");
  }
  const std::int32_t most = *std::max_element(heights.begin(), heights.end());
  for (std::size_t i = 0; i < names.size(); ++i) {
    const bool known = base != kUndefined && heights[i] != kUndefined;
    const std::int64_t y = std::int64_t(base) + (std::int64_t(most) - heights[i]) / 2;
    Define(names[i], known ? static_cast<std::int32_t>(y) : kUndefined);
  }
}

std::unique_ptr<CViewProxy> CSwiftViewScope::ParseView(CZilLexer& lexer, int nesting) {
  const CZilToken name = lexer.Next();
  if (nesting >= kMaxNesting) {
    throw CZilSyntaxError(name.line, "views are nested too deeply");
  }
  generator_->CountView(name.line);
  lexer.Expect("(", "after the class name " + std::string(name.text.substr(0, 40)));
  auto proxy = std::make_unique<CViewProxy>(std::string(name.text));
  auto own = std::make_unique<CSwiftViewScope>(this, generator_);
  if (!lexer.IsPunct(")")) {
    do {
      const std::string_view parameter = lexer.ExpectName("for a parameter");
      lexer.Expect(":", "after the parameter " + std::string(parameter.substr(0, 40)));
      const Value value = own->ParseValue(lexer);
      own->DefineSymbol(parameter, value.value, value.string, value.hasString);
      proxy->properties.SetVariable(parameter, value.value, value.string, value.hasString,
                                    value.text);
    } while (lexer.Accept(","));
  }
  lexer.Expect(")", "after the parameters of " + std::string(name.text.substr(0, 40)));
  std::unique_ptr<CSwiftViewScope> block;
  if (lexer.Accept("{")) {
    block = std::make_unique<CSwiftViewScope>(own.get(), generator_);
    block->ParseDefinition(lexer, proxy->children, nesting + 1);
    lexer.Expect("}", "to close the block of " + std::string(name.text.substr(0, 40)));
  } else {
    lexer.Expect(";", "or a block after the view " + std::string(name.text.substr(0, 40)));
  }
  ReadFields(*proxy, *own, block ? static_cast<const CExpressionScope&>(*block) : *own);
  return proxy;
}

void CSwiftViewScope::ReadFields(CViewProxy& proxy, const CSwiftViewScope& own,
                                 const CExpressionScope& inner) {
  auto given = [&](std::string_view name, std::int32_t& out) {
    const Symbol* s = own.FindHere(name);
    if (s == nullptr || s->value == kUndefined) return false;
    out = s->value;
    return true;
  };
  auto read = [&](std::initializer_list<std::string_view> names, std::int32_t fallback) {
    std::int32_t v = fallback;
    for (std::string_view n : names) {
      if (given(n, v)) return v;
    }
    return v;
  };
  std::int32_t v = 0;
  proxy.width = Size(read({"width"}, 0));
  proxy.height = Size(read({"height"}, 0));
  proxy.maxHeight = Size(read({"max_height"}, 0));
  proxy.inset = Offset(read({"inset"}, 0));
  proxy.topInset = Offset(read({"top_inset", "inset"}, 0));
  const std::int32_t outset = read({"outset"}, 0);
  const std::int32_t outsetX = read({"outset_width", "width_outset"}, outset);
  const std::int32_t outsetY = read({"outset_height", "height_outset"}, outset);
  proxy.outsetLeft = Size(read({"outset_left", "left_outset"}, outsetX));
  proxy.outsetRight = Size(read({"outset_right", "right_outset"}, outsetX));
  proxy.outsetTop = Size(read({"outset_top", "top_outset"}, outsetY));
  proxy.outsetBottom = Size(read({"outset_bottom", "bottom_outset"}, outsetY));
  if (given("label_width", v)) {
    proxy.labelWidth = Size(v);
    proxy.hasLabelWidth = true;
  }
  proxy.horizontal = std::clamp(read({"horizontal"}, 0), 0, 5);
  proxy.vertical = std::clamp(read({"vertical"}, 0), 0, 5);
  proxy.alwaysL2R = read({"alwaysL2R"}, 0) != 0;
  const std::int32_t margin = read({"margin"}, 0);
  const std::int32_t marginX = read({"margin_width"}, margin);
  const std::int32_t marginY = read({"margin_height"}, margin);
  proxy.marginLeft = Size(read({"margin_left"}, marginX));
  proxy.marginRight = Size(read({"margin_right"}, marginX));
  proxy.marginTop = Size(read({"margin_top"}, marginY));
  proxy.marginBottom = Size(read({"margin_bottom"}, marginY));
  std::int32_t spacing = inner.Value("gSpace");
  if (spacing == kUndefined) spacing = 0;
  proxy.spacing = Size(read({"spacing"}, spacing));
  proxy.placement = std::clamp(read({"placement"}, kPlace_Column), 0, 2);
  proxy.childHorizontal = std::clamp(read({"child_horizontal"}, 0), 0, 5);
  proxy.childVertical = std::clamp(read({"child_vertical"}, 0), 0, 5);
  proxy.reverse = read({"reverse"}, 0) != 0;
  proxy.leftOffset = Offset(read({"left_offset"}, 0));
  proxy.topOffset = Offset(read({"top_offset"}, 0));
  const std::int32_t cushion = read({"cushion"}, 0);
  const std::int32_t cushionX = read({"cushion_x"}, cushion);
  const std::int32_t cushionY = read({"cushion_y"}, cushion);
  proxy.cushionLeft = Size(read({"cushion_left"}, cushionX));
  proxy.cushionRight = Size(read({"cushion_right"}, cushionX));
  proxy.cushionTop = Size(read({"cushion_top"}, cushionY));
  proxy.cushionBottom = Size(read({"cushion_bottom"}, cushionY));
  if (proxy.reverse) std::reverse(proxy.children.begin(), proxy.children.end());
  for (std::string_view name : kInherited) {
    if (proxy.properties.Has(name)) continue;
    if (const Symbol* s = own.Find(name)) {
      proxy.properties.SetVariable(name, s->value, s->string, s->hasString, s->name);
    }
  }
}

}  // namespace Tarsa
