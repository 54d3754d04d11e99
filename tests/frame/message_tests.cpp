// The 65 identifiers against their literal spelling and the host's catalogue,
// and the identified exception raised with and without the legacy report.
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
    std::string literal;
    std::type_index tagType;
    std::type_index errorType;
    std::function<std::string()> joinedTagName;  // group:leaf of a new tag
    std::function<void()> raise;                 // raises it, throws if it comes back
};

template <class Tag>
Identifier identifier(std::string literal) {
    return {std::move(literal), typeid(Tag), typeid(ErrorOf<Tag>),
            [] {
                const Tag tag;
                EXPECT_TRUE(tag.arguments.empty());
                return tag.group + ':' + tag.leaf;
            },
            [] { raiseError<Tag>(); }};
}

const std::vector<Identifier>& allIdentifiers() {
    namespace V = VESPRA;
    static const std::vector<Identifier> all{
        identifier<V::Bitand::sparseArgs>("VESPRA:Bitand:sparseArgs"),
        identifier<V::Bitand::operandsNotNumeric>("VESPRA:Bitand:operandsNotNumeric"),
        identifier<V::Bitand::complexInputs>("VESPRA:Bitand:complexInputs"),
        identifier<V::Bitand::firstArgsNotInt>("VESPRA:Bitand:firstArgsNotInt"),
        identifier<V::Bitand::sizeMismatch>("VESPRA:Bitand:sizeMismatch"),
        identifier<V::Bitand::mixedClasses>("VESPRA:Bitand:mixedClasses"),
        identifier<V::Bitand::unknownTypeString>("VESPRA:Bitand:unknownTypeString"),
        identifier<V::Bitand::invalidTypeString>("VESPRA:Bitand:invalidTypeString"),
        identifier<V::Bitand::outOfRangeMixedType>("VESPRA:Bitand:outOfRangeMixedType"),
        identifier<V::Bitand::outOfRange>("VESPRA:Bitand:outOfRange"),
        identifier<V::Bitor::sparseArgs>("VESPRA:Bitor:sparseArgs"),
        identifier<V::Bitor::operandsNotNumeric>("VESPRA:Bitor:operandsNotNumeric"),
        identifier<V::Bitor::complexInputs>("VESPRA:Bitor:complexInputs"),
        identifier<V::Bitor::firstArgsNotInt>("VESPRA:Bitor:firstArgsNotInt"),
        identifier<V::Bitor::sizeMismatch>("VESPRA:Bitor:sizeMismatch"),
        identifier<V::Bitor::mixedClasses>("VESPRA:Bitor:mixedClasses"),
        identifier<V::Bitor::unknownTypeString>("VESPRA:Bitor:unknownTypeString"),
        identifier<V::Bitor::invalidTypeString>("VESPRA:Bitor:invalidTypeString"),
        identifier<V::Bitor::outOfRangeMixedType>("VESPRA:Bitor:outOfRangeMixedType"),
        identifier<V::Bitor::outOfRange>("VESPRA:Bitor:outOfRange"),
        identifier<V::bitxor::sparseArgs>("VESPRA:bitxor:sparseArgs"),
        identifier<V::bitxor::operandsNotNumeric>("VESPRA:bitxor:operandsNotNumeric"),
        identifier<V::bitxor::complexInputs>("VESPRA:bitxor:complexInputs"),
        identifier<V::bitxor::firstArgsNotInt>("VESPRA:bitxor:firstArgsNotInt"),
        identifier<V::bitxor::sizeMismatch>("VESPRA:bitxor:sizeMismatch"),
        identifier<V::bitxor::mixedClasses>("VESPRA:bitxor:mixedClasses"),
        identifier<V::bitxor::unknownTypeString>("VESPRA:bitxor:unknownTypeString"),
        identifier<V::bitxor::invalidTypeString>("VESPRA:bitxor:invalidTypeString"),
        identifier<V::bitxor::outOfRangeMixedType>("VESPRA:bitxor:outOfRangeMixedType"),
        identifier<V::bitxor::outOfRange>("VESPRA:bitxor:outOfRange"),
        identifier<V::bitcmp::firstArgNotInt>("VESPRA:bitcmp:firstArgNotInt"),
        identifier<V::bitcmp::sparseArgs>("VESPRA:bitcmp:sparseArgs"),
        identifier<V::bitcmp::complexOperands>("VESPRA:bitcmp:complexOperands"),
        identifier<V::bitcmp::unknownTypeString>("VESPRA:bitcmp:unknownTypeString"),
        identifier<V::bitcmp::invalidTypeString>("VESPRA:bitcmp:invalidTypeString"),
        identifier<V::bitcmp::outOfRange>("VESPRA:bitcmp:outOfRange"),
        identifier<V::bitget::sparseArgs>("VESPRA:bitget:sparseArgs"),
        identifier<V::bitget::numericArg>("VESPRA:bitget:numericArg"),
        identifier<V::bitget::complexArgs>("VESPRA:bitget:complexArgs"),
        identifier<V::bitget::sizeMismatch>("VESPRA:bitget:sizeMismatch"),
        identifier<V::bitget::unknownTypeString>("VESPRA:bitget:unknownTypeString"),
        identifier<V::bitget::invalidTypeString>("VESPRA:bitget:invalidTypeString"),
        identifier<V::bitget::outOfRange>("VESPRA:bitget:outOfRange"),
        identifier<V::bitSetGet::firstArgNotInt>("VESPRA:bitSetGet:firstArgNotInt"),
        identifier<V::bitSetGet::sizeMismatch>("VESPRA:bitSetGet:sizeMismatch"),
        identifier<V::bitSetGet::BITOutOfRange>("VESPRA:bitSetGet:BITOutOfRange"),
        identifier<V::bitset::sparseArgs>("VESPRA:bitset:sparseArgs"),
        identifier<V::bitset::numericArg>("VESPRA:bitset:numericArg"),
        identifier<V::bitset::complexArgs>("VESPRA:bitset:complexArgs"),
        identifier<V::bitset::invalidV>("VESPRA:bitset:invalidV"),
        identifier<V::bitset::sizeMismatch>("VESPRA:bitset:sizeMismatch"),
        identifier<V::bitset::unknownTypeString>("VESPRA:bitset:unknownTypeString"),
        identifier<V::bitset::invalidTypeString>("VESPRA:bitset:invalidTypeString"),
        identifier<V::bitset::outOfRange>("VESPRA:bitset:outOfRange"),
        identifier<V::bitshift::sparseArgs>("VESPRA:bitshift:sparseArgs"),
        identifier<V::bitshift::numericArg>("VESPRA:bitshift:numericArg"),
        identifier<V::bitshift::complexArgs>("VESPRA:bitshift:complexArgs"),
        identifier<V::bitshift::firstArgNotInt>("VESPRA:bitshift:firstArgNotInt"),
        identifier<V::bitshift::sizeMismatch>("VESPRA:bitshift:sizeMismatch"),
        identifier<V::bitshift::unknownTypeString>("VESPRA:bitshift:unknownTypeString"),
        identifier<V::bitshift::invalidTypeString>("VESPRA:bitshift:invalidTypeString"),
        identifier<V::bitshift::outOfRange>("VESPRA:bitshift:outOfRange"),
        identifier<V::bitshift::inputsMustBeIntegers>("VESPRA:bitshift:inputsMustBeIntegers"),
        identifier<V::string::MustBeStringScalarOrCharacterVector>(
            "VESPRA:string:MustBeStringScalarOrCharacterVector"),
        identifier<V::string::MissingNotSupported>("VESPRA:string:MissingNotSupported"),
    };
    return all;
}

std::string groupOf(std::string_view identifier) {
    return std::string(identifier.substr(0, identifier.rfind(':')));
}

// Generic code names a tag by group and leaf and gets the same class.
static_assert(
    std::is_same_v<MessageTag<"VESPRA:bitxor", "sizeMismatch">, VESPRA::bitxor::sizeMismatch>);
static_assert(
    std::is_same_v<MessageTag<VESPRA::Bitor::group, "outOfRange">, VESPRA::Bitor::outOfRange>);
static_assert(!std::is_same_v<VESPRA::Bitand::sparseArgs, VESPRA::bitxor::sparseArgs>);

TEST(Identifiers, EachIsItsOwnTagSpelledExactly) {
    const auto& all = allIdentifiers();
    std::set<std::string> literals;
    std::set<std::type_index> types;
    for (const Identifier& id : all) {
        EXPECT_EQ(id.joinedTagName(), id.literal);
        literals.insert(id.literal);
        types.insert(id.tagType);
    }
    EXPECT_EQ(all.size(), 65u);
    EXPECT_EQ(literals.size(), 65u);
    EXPECT_EQ(types.size(), 65u);
}

TEST(Identifiers, CatalogueHasASentenceForEachAndNoStrayOnes) {
    std::set<std::string> literals, groups;
    for (const Identifier& id : allIdentifiers()) {
        EXPECT_FALSE(host::catalogueSentence(id.literal).empty()) << id.literal;
        literals.insert(id.literal);
        groups.insert(groupOf(id.literal));
    }
    for (const host::CatalogueEntry& entry : host::catalogue()) {
        const std::string identifier(entry.identifier);
        if (groups.contains(groupOf(identifier))) {
            EXPECT_TRUE(literals.contains(identifier)) << identifier;
        }
    }
    // Bitand, Bitor, bitxor, bitcmp, bitget, bitSetGet, bitset, bitshift, string.
    EXPECT_EQ(groups.size(), 9u);
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
            ADD_FAILURE() << id.literal << " came back";
        } catch (const foundation::core::except::IMsgIDException& error) {
            EXPECT_EQ(std::type_index(typeid(error)), id.errorType) << id.literal;
            EXPECT_EQ(error.GetID(), id.literal);
            const resource_core::BaseMsgID* message = error.GetBaseMsgIDObj();
            EXPECT_EQ(message->group + ':' + message->leaf, id.literal);
            EXPECT_STREQ(error.what(), std::string(host::catalogueSentence(id.literal)).c_str());
        }
        EXPECT_EQ(host::legacyErrorCount(), reportsBefore + 1) << id.literal;
        if (!GetParam()) {
            EXPECT_EQ(host::lastLegacyErrorId(), id.literal);
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
