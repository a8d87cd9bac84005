#include <gtest/gtest.h>

#include <string>

#include "framework/resource/ModuleResources.h"
#include "host/actions/ActionFile.h"
#include "host/actions/ActionTerms.h"
#include "host/io/HostError.h"

namespace Host {
namespace {

// The module's own terminology, as the host reads it from the module file.
ActionTerms ModuleTerms() {
  const Tarsa::CResourceTable table = Tarsa::ModuleResourceTable();
  return ActionTerms(
      Tarsa::CTerminology(table.Get(Tarsa::kTerminologyType, Tarsa::kTerminologyNumber)));
}

TEST(ActionTermsTest, ValuesTheModuleCannotTakeAreRefusedAtTheirLine) {
  const ActionTerms terms = ModuleTerms();
  struct Case {
    const char* text;
    const char* says;
  };
  const Case cases[] = {
      {"archway-action 1\nprjM enumerated regM steR\n",
       "line 2: 'prjM' (Projection Model) takes an enumerated value of type 'prjM'"},
      {"archway-action 1\n# note\nfocL float nan\n",
       "line 3: 'focL' (Focal Length) must be a finite number"},
      {"archway-action 1\nCrpF float -inf\n",
       "line 2: 'CrpF' (Crop Factor) must be a finite number"},
      {"archway-action 1\nPhyF integer 14\n",
       "line 2: 'PhyF' (Physical Focal Length) takes a float, not integer"},
      {"archway-action 1\ncnsD float 1\n",
       "line 2: 'cnsD' (Constraint Data) takes data, not float"},
  };
  for (const Case& c : cases) {
    EXPECT_NO_THROW(ActionFile::Parse(c.text)) << "the text alone is well formed: " << c.text;
    try {
      ActionFile::Parse(c.text, &terms);
      ADD_FAILURE() << "accepted: " << c.text;
    } catch (const HostError& error) {
      EXPECT_STREQ(error.what(), c.says);
    }
  }
}

TEST(ActionTermsTest, EveryDeclaredValueAndUndeclaredKeysPass) {
  const ActionTerms terms = ModuleTerms();
  const char* text =
      "archway-action 1\n"
      "actV integer 1\n"
      "cnsD data 0\n"
      "focL float 812.5\n"
      "PhyF float 14\n"
      "CrpF float 1.5\n"
      "imgS integer 100\n"
      "imgX float nan\n";  // undeclared: the module judges it
  EXPECT_EQ(ActionFile::Parse(text, &terms).Count(), 7u);
  // fusP is not offered, yet the module reads it; and the module, not the
  // host, refuses values it does not know.
  for (const char* value : {"fisP", "perP", "panP", "autP", "fusP", "xxxx"}) {
    EXPECT_NO_THROW(ActionFile::Parse(
        std::string("archway-action 1\nprjM enumerated prjM ") + value + "\n", &terms));
  }
  for (const char* value : {"steR", "merR", "panR", "autR"}) {
    EXPECT_NO_THROW(ActionFile::Parse(
        std::string("archway-action 1\nregM enumerated regM ") + value + "\n", &terms));
  }
}

}  // namespace
}  // namespace Host
