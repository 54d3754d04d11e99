// The identifiers of every group against the host's catalogue, and the
// identified exception raised with and without the legacy report.
#include "frame/ctype_error.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "host/host_control.hpp"
#include "host/message_catalogue.hpp"

#include <gtest/gtest.h>
#include <boost/exception/get_error_info.hpp>
#include <boost/exception/info.hpp>

#include <functional>
#include <memory>
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

template <class... Tags>
void collect(TypeList<Tags...>, std::vector<Identifier>& all) {
    (all.push_back(identifier<Tags>()), ...);
}

// Every tag of every group, walked from the groups' own lists.
const std::vector<Identifier>& allIdentifiers() {
    static const std::vector<Identifier> all = [] {
        std::vector<Identifier> collected;
        [&]<class... Groups>(TypeList<Groups...>) {
            (collect(typename Groups::Tags{}, collected), ...);
        }(VESPRA::Groups{});
        return collected;
    }();
    return all;
}

std::string groupOf(std::string_view identifier) {
    return std::string(identifier.substr(0, identifier.rfind(':')));
}

static_assert(!std::is_same_v<VESPRA::Bitand::sparseArgs, VESPRA::bitxor::sparseArgs>);

// The groups' tags are exactly the catalogue's identifiers of those groups,
// each spelled as the catalogue spells it.
TEST(Identifiers, AreExactlyTheCatalogueOfTheirGroups) {
    std::set<std::string> joined, groups;
    for (const Identifier& id : allIdentifiers()) {
        EXPECT_FALSE(host::catalogueSentence(id.joined).empty()) << id.joined;
        joined.insert(id.joined);
        groups.insert(groupOf(id.joined));
    }
    EXPECT_EQ(joined.size(), 65u);
    for (const host::CatalogueEntry& entry : host::catalogue()) {
        const std::string identifier(entry.identifier);
        if (groups.contains(groupOf(identifier))) {
            EXPECT_TRUE(joined.contains(identifier)) << identifier;
        }
    }
}

class Raising : public ::testing::TestWithParam<bool> {
protected:
    void SetUp() override {
        host::setLegacyErrorRaises(GetParam());
        host::resetLegacyErrors();
    }
    void TearDown() override { host::setLegacyErrorRaises(true); }
};

// Whether the legacy report raises or comes back, the caller receives the
// error of the tag's own type, and the report saw it once.
TEST_P(Raising, EveryIdentifierReachesTheCallerAsItsOwnException) {
    for (const Identifier& id : allIdentifiers()) {
        const std::size_t reportsBefore = host::legacyErrorCount();
        try {
            id.raise();
            ADD_FAILURE() << id.joined << " came back";
        } catch (const foundation::core::except::IMsgIDException& error) {
            EXPECT_EQ(std::type_index(typeid(error)), id.errorType) << id.joined;
            EXPECT_EQ(error.GetID(), id.joined);
            const resource_core::BaseMsgID* message = error.GetBaseMsgIDObj();
            EXPECT_EQ(message->group + ':' + message->leaf, id.joined);
            EXPECT_STREQ(error.what(), std::string(host::catalogueSentence(id.joined)).c_str());
        }
        EXPECT_EQ(host::legacyErrorCount(), reportsBefore + 1) << id.joined;
        if (!GetParam()) {
            EXPECT_EQ(host::lastLegacyErrorId(), id.joined);
        }
    }
}

INSTANTIATE_TEST_SUITE_P(LegacyReport, Raising, ::testing::Values(true, false),
                         [](const auto& legacy) { return legacy.param ? "raises" : "comesBack"; });

using ExtraInfo = boost::error_info<struct ExtraInfoTag, int>;

TEST(IdentifiedException, CopiesAndClonesOutliveTheOriginal) {
    using Tag = VESPRA::bitshift::outOfRange;
    auto original = std::make_unique<ErrorOf<Tag>>(Tag{});
    *original << ExtraInfo(7);

    const ErrorOf<Tag> copy(*original);
    std::unique_ptr<const boost::exception_detail::clone_base> clone(original->clone());
    EXPECT_NE(clone.get(), static_cast<const boost::exception_detail::clone_base*>(original.get()));
    EXPECT_NE(copy.GetBaseMsgIDObj(), original->GetBaseMsgIDObj());
    original.reset();

    const auto& cloned = dynamic_cast<const ErrorOf<Tag>&>(*clone);
    for (const ErrorOf<Tag>* survivor : {&copy, &cloned}) {
        EXPECT_EQ(survivor->GetID(), "VESPRA:bitshift:outOfRange");
        EXPECT_EQ(survivor->GetBaseMsgIDObj()->leaf, "outOfRange");
        ASSERT_NE(boost::get_error_info<ExtraInfo>(*survivor), nullptr);
        EXPECT_EQ(*boost::get_error_info<ExtraInfo>(*survivor), 7);
        EXPECT_STREQ(static_cast<const std::exception&>(*survivor).what(),
                     static_cast<const foundation::core::except::IException&>(*survivor).what());
    }
    EXPECT_THROW(cloned.rethrow(), ErrorOf<Tag>);
}

TEST(InvalidCharacter, IsThrownWrappedAndReadsAsItsText) {
    try {
        foundation::ustring::detail::throw_ctype_invalid_character_exception();
    } catch (const boost::exception_detail::clone_impl<foundation::ustring::CtypeInvalidCharacter>&
                 error) {
        EXPECT_STREQ(error.what(), "Invalid character error.");
        EXPECT_EQ(error.kind(), 3);
        return;
    }
    ADD_FAILURE() << "nothing thrown";
}

}  // namespace
