// The identifiers of every group against the host's catalogue, and the
// identified exception raised with and without the legacy report. The
// caller catches a copy of an error whose original is gone, so the sanitizer
// build sees a copy that still reads its original's storage.
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "host/host_control.hpp"
#include "host/message_catalogue.hpp"

#include <gtest/gtest.h>

#include <functional>
#include <set>
#include <string>
#include <typeindex>
#include <vector>

namespace {

using namespace bitfcns;

struct Identifier {
    std::string joined;  // group:leaf as a new tag holds them
    std::type_index errorType;
    std::function<void()> raise;  // raises it, throws if it comes back
};

template <class Tag>
Identifier identifier() {
    const Tag tag;
    EXPECT_TRUE(tag.arguments.empty());
    return {tag.group + ':' + tag.leaf, typeid(ErrorOf<Tag>), [] { raiseError<Tag>(); }};
}

// Every tag of every group, walked from the groups' own lists.
std::vector<Identifier> allIdentifiers() {
    std::vector<Identifier> all;
    [&]<class... Groups>(TypeList<Groups...>) {
        ([&]<class... Tags>(TypeList<Tags...>) { (all.push_back(identifier<Tags>()), ...); }(
             typename Groups::Tags{}),
         ...);
    }(VESPRA::Groups{});
    return all;
}

std::string groupOf(std::string_view identifier) {
    return std::string(identifier.substr(0, identifier.rfind(':')));
}

// The groups' tags are exactly the catalogue's identifiers of those groups.
// Whether the legacy report raises or comes back, the caller receives the
// error of the tag's own type, with the catalogue's sentence, and the report
// saw it once.
TEST(Identifiers, EachIsInTheCatalogueAndReachesTheCallerAsItsOwnException) {
    std::set<std::string> joined, groups;
    for (bool raises : {true, false}) {
        host::setLegacyErrorRaises(raises);
        host::resetLegacyErrors();
        for (const Identifier& id : allIdentifiers()) {
            SCOPED_TRACE(testing::Message() << id.joined << (raises ? ", raising" : ""));
            joined.insert(id.joined);
            groups.insert(groupOf(id.joined));
            const std::size_t reportsBefore = host::legacyErrorCount();
            try {
                id.raise();
                ADD_FAILURE() << "came back";
            } catch (const foundation::core::except::IMsgIDException& error) {
                EXPECT_EQ(std::type_index(typeid(error)), id.errorType);
                EXPECT_EQ(error.GetID(), id.joined);
                const resource_core::BaseMsgID* message = error.GetBaseMsgIDObj();
                EXPECT_EQ(message->group + ':' + message->leaf, id.joined);
                EXPECT_FALSE(host::catalogueSentence(id.joined).empty());
                EXPECT_STREQ(error.what(), std::string(host::catalogueSentence(id.joined)).c_str());
            }
            EXPECT_EQ(host::legacyErrorCount(), reportsBefore + 1);
            EXPECT_TRUE(raises || host::lastLegacyErrorId() == id.joined);
        }
    }
    host::setLegacyErrorRaises(true);
    EXPECT_EQ(joined.size(), 65u);
    for (const host::CatalogueEntry& entry : host::catalogue()) {
        const std::string identifier(entry.identifier);
        EXPECT_TRUE(!groups.contains(groupOf(identifier)) || joined.contains(identifier))
            << identifier;
    }
}

}  // namespace
