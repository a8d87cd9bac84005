#include <gtest/gtest.h>

#include "framework/strings/CString.h"
#include "framework/strings/CStringTable.h"
#include "tests/framework/strings/StringTestSupport.h"

namespace Tarsa {
namespace {

using Resolve = testing::FreshStringTable;
using testing::FakeSource;

TEST_F(Resolve, ParametersSurviveResolveAndAreFilledInOrder) {
  const CString title("$$$/Archway/Dialog/Title=Archway (^0 @ ^1%)");
  EXPECT_EQ(ResolveText(title.Str()).Str(), "Archway (^0 @ ^1%)");
  const CString full = title.Replace(0, "fish.jpg").Replace(1, "50");
  EXPECT_EQ(full.Str(), "Archway (fish.jpg @ 50%)");
  // The only "^0" is gone: a second fill changes nothing.
  EXPECT_EQ(full.Replace(0, "other.jpg").Str(), "Archway (fish.jpg @ 50%)");
  EXPECT_EQ(title.Str(), "$$$/Archway/Dialog/Title=Archway (^0 @ ^1%)");  // Replace is const

  EXPECT_EQ(CString("^0 and ^0").Replace(0, "x").Str(), "x and ^0");  // first place only
  EXPECT_EQ(CString("a ^0 b").Replace(0, "^0^0").Str(), "a ^0^0 b");  // value not rescanned
}

TEST_F(Resolve, DefaultsAndKeys) {
  EXPECT_EQ(ResolveText("$$$/K=Line^nTwo \\\"q\\\" ^0").Str(), "Line\nTwo \"q\" ^0");
  EXPECT_EQ(ResolveText("$$$/Eq=a=b").Str(), "a=b");  // the first "=" ends the key
  EXPECT_EQ(ResolveText("$$$/Empty").Str(), "");      // no "=": no default
  EXPECT_EQ(ResolveText("$$$=text").Str(), "");       // no key: nothing at all

  const CStringTable* table = CStringTable::Get(false);
  ASSERT_NE(table, nullptr);
  ASSERT_NE(table->Find("/K"), nullptr);  // stored with its "/", without "$$$"
  EXPECT_EQ(table->Find("/K")->Str(), "Line\nTwo \"q\" ^0");
  EXPECT_EQ(table->Find("/Empty")->Str(), "");
  EXPECT_EQ(table->Count(), 3u);  // the empty key was not stored

  CString twice("$$$/K=other default");
  twice.Resolve();  // the table answers now
  twice.Resolve();  // and a resolved text stays as it is
  EXPECT_EQ(twice.Str(), "Line\nTwo \"q\" ^0");
}

TEST_F(Resolve, TextsThatAreNotKeyedStayAsTheyAre) {
  for (const char* text : {"", "$$", "$$x/K=v", "plain ^n text", " $$$/K=v"}) {
    EXPECT_EQ(ResolveText(text).Str(), text);
  }
  EXPECT_EQ(CStringTable::Get(false), nullptr);  // and the table was never needed
}

TEST_F(Resolve, TableThenSourceThenDefault) {
  FakeSource source;
  source.answers["$$$/InTable=default"] = "from host";
  source.answers["$$$/Host=default"] = "host ^n text";
  CStringTable::Get(true)->Insert("/InTable", "from table", false);

  EXPECT_EQ(ResolveText("$$$/InTable=default").Str(), "from table");
  EXPECT_EQ(source.lookups, 0);
  EXPECT_EQ(ResolveText("$$$/Host=default").Str(), "host ^n text");  // host texts are final
  EXPECT_EQ(ResolveText("$$$/Unknown=fallback^n").Str(), "fallback\n");
  EXPECT_EQ(source.lookups, 2);
  // Both answers were remembered: the host is asked once per key and run.
  EXPECT_EQ(ResolveText("$$$/Host=default").Str(), "host ^n text");
  EXPECT_EQ(ResolveText("$$$/Unknown=fallback^n").Str(), "fallback\n");
  EXPECT_EQ(source.lookups, 2);
}

TEST_F(Resolve, SourcePreferringDefaultsIsNeverAsked) {
  FakeSource source(/*prefersDefaults=*/true);
  source.answers["$$$/A=default a"] = "host a";
  EXPECT_EQ(ResolveText("$$$/A=default a").Str(), "default a");
  EXPECT_EQ(ResolveText("$$$/B=default b").Str(), "default b");
  EXPECT_EQ(source.lookups, 0);
  EXPECT_EQ(source.preferenceQuestions, 1);  // asked once, then remembered
}

TEST_F(Resolve, SourceMayDropTheTableWhileAnswering) {
  struct DroppingSource : CStringSource {
    bool LookupString(const CString&, CString& text) override {
      CStringTable::Drop();
      text = "late";
      return true;
    }
  } source;
  EXPECT_EQ(ResolveText("$$$/K=default").Str(), "late");
  EXPECT_EQ(CStringTable::Get(true)->Find("/K")->Str(), "late");
}

TEST(CStringSharing, CopiesShareUntilOneChanges) {
  const CString a("line^n ^0");
  CString b = a;
  CString c = a;
  c.ParseEscapes();
  EXPECT_EQ(a.Str(), "line^n ^0");
  EXPECT_EQ(c.Str(), "line\n ^0");
  EXPECT_EQ(b.ShareCount(), 2);  // a and b still share; c has its own bytes
}

}  // namespace
}  // namespace Tarsa
