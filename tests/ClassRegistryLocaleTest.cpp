// The class registry where case does not mean what it means in ASCII: in Turkish, I is the capital of a
// dotless i, which is the byte 0xFD, and i the small letter of a dotted I, which is 0xDD.
#include "TestLocales.h"

#include "ClassTable.h"
#include "ProviderUtilities.h"

#include <string>
#include <strings.h>

namespace {

unsigned short chain(const char* name) {
    for (const TK::ClassEntry& entry : TK::classTable) {
        if (strcasecmp(name, entry.name) == 0) {
            return entry.id;
        }
    }
    return 255;
}

} // namespace

TEST(ClassRegistryInTurkish, AnswersAsAChainOfComparisons) {
    const ThreadLocale turkish("tr_TR.ISO-8859-9");
    ASSERT_EQ(strcasecmp("I", "\xFD"), 0);
    ASSERT_EQ(strcasecmp("i", "\xDD"), 0);
    ASSERT_NE(strcasecmp("i", "I"), 0);
    const std::string letters = "iI\xDD\xFD\x80\xC4\xE4";
    int known = 0;
    for (const TK::ClassEntry& entry : TK::classTable) {
        std::string name = entry.name;
        for (char& character : name) {
            const char before = character;
            for (const char letter : letters) {
                character = letter;
                const unsigned short id = chain(name.c_str());
                known += id != 255 ? 1 : 0;
                ASSERT_EQ(TK::ProviderUtilities::getClassId(name.c_str()), id) << name;
            }
            character = before;
        }
    }
    EXPECT_GT(known, 100);
}
