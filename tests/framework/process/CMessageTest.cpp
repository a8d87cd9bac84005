#include "framework/process/CMessage.h"

#include <gtest/gtest.h>

#include "framework/process/CMessageNames.h"
#include "framework/process/CObjID.h"
#include "framework/process/CValMsg.h"
#include "framework/process/WindowKinds.h"

namespace Tarsa {
namespace {

TEST(CObjID, InterningIsStableAndRoundTrips) {
  const CObjID a = CObjID::Intern("Test/Atom/Alpha");
  EXPECT_EQ(CObjID::Intern(std::string("Test/Atom/") + "Alpha"), a);
  EXPECT_EQ(a.Text(), "Test/Atom/Alpha");
  EXPECT_NE(CObjID::Intern("test/atom/alpha"), a);  // case matters
  EXPECT_TRUE(CObjID::Find("Test/Atom/NeverMade").IsNull());
  EXPECT_TRUE(CObjID::Intern("").IsNull());
  EXPECT_EQ(CObjID(0xFFFFFFF0u).Text(), "");
  // The framework's names are interned once, under their own texts.
  EXPECT_EQ(CMessageNames::Get().sizeBoxEnd, CObjID::Intern("tarsa/message/sizeBoxEnd"));
}

TEST(CMessage, CopiesStartUnhandledAndKeepEverythingElse) {
  CMessage original(CObjID::Intern("Test/Message"), 2.5, 8, 0x1234);
  original.flags |= 0x10;  // a bit of someone else's
  original.SetHandled();
  CMessage copy(original);
  EXPECT_FALSE(copy.IsHandled());
  EXPECT_EQ(copy.flags, 0x10u);
  EXPECT_EQ(copy.time, 2.5);
  EXPECT_EQ(copy.source, 0x1234u);
  CMessage assigned;
  assigned = original;
  EXPECT_FALSE(assigned.IsHandled());
  EXPECT_EQ(assigned.name, original.name);

  CValMsg<CObjID> valued(CObjID::Intern("Test/Value"), CObjID::Intern("Test/Payload"),
                         CValueMessage::kChange_Tracking);
  valued.SetHandled();
  std::unique_ptr<CMessage> clone = valued.Clone();
  auto* typed = dynamic_cast<CValMsg<CObjID>*>(clone.get());
  ASSERT_NE(typed, nullptr);
  EXPECT_FALSE(typed->IsHandled());
  EXPECT_EQ(typed->value.Text(), "Test/Payload");
  EXPECT_EQ(typed->change, CValueMessage::kChange_Tracking);
}

TEST(WindowKinds, UnknownKindsFallBackAndTagsAreBigEndian) {
  EXPECT_STREQ(WindowClassName(99), "Tarsa_WindowClass");
  EXPECT_EQ(WindowKindTag(1), 0x4D6D7677u);  // 'M' 'm' 'v' 'w'
}

}  // namespace
}  // namespace Tarsa
