#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/linux/installer/PrompterChain.h"
#include "tests/install/InstallRun.h"

namespace ventras {
namespace {

using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

const InstallQuestion kQuestion{"Install it?", "A driver", "Install", "Not Now", "printer"};

// Two people, of whom the second is asked when the first cannot be.
class Chain : public testing::Test {
protected:
    PromptAnswer ask(PromptAnswer first, PromptAnswer second, std::chrono::milliseconds limit = 5s) {
        first_ = {.answer = first};
        second_ = {.answer = second};
        std::vector<std::unique_ptr<Prompter>> prompters;
        prompters.push_back(first_.prompter());
        prompters.push_back(second_.prompter());
        chain_.emplace(std::move(prompters));
        return chain_->ask(kQuestion, Deadline::after(limit));
    }

    Person first_, second_;
    std::optional<PrompterChain> chain_;
};

TEST_F(Chain, EndsWithTheFirstWhoWasAsked) {
    for (const auto answer : {PromptAnswer::Yes, PromptAnswer::No, PromptAnswer::Unanswered}) {
        EXPECT_EQ(ask(answer, PromptAnswer::Yes), answer);
        EXPECT_THAT(second_.questions, IsEmpty());
    }
}

TEST_F(Chain, GoesOnWhereTheFirstCannotBeAsked) {
    for (const auto answer :
         {PromptAnswer::Yes, PromptAnswer::No, PromptAnswer::Unanswered, PromptAnswer::NotAsked})
        EXPECT_EQ(ask(PromptAnswer::NotAsked, answer), answer);
}

TEST_F(Chain, AsksNobodyWhenTheTimeIsOver) {
    EXPECT_EQ(ask(PromptAnswer::NotAsked, PromptAnswer::Yes, 0ms), PromptAnswer::Unanswered);
    EXPECT_THAT(second_.questions, IsEmpty());
}

TEST_F(Chain, ShowsTheRestToWhoAnswered) {
    ask(PromptAnswer::NotAsked, PromptAnswer::Yes);
    chain_->showProgress("Installing", 7);
    chain_->finish("Done", "really");
    EXPECT_THAT(first_.progress, IsEmpty());
    EXPECT_THAT(second_.progress, ElementsAre("Installing 7"));
    EXPECT_THAT(second_.lastWords, ElementsAre("Done|really"));
}

TEST_F(Chain, ShowsNothingBeforeAnybodyWasAsked) {
    PrompterChain chain({});
    chain.showProgress("Installing", 7);
    chain.finish("Done", "");
    EXPECT_EQ(chain.ask(kQuestion, Deadline::after(1s)), PromptAnswer::NotAsked);
}

}  // namespace
}  // namespace ventras
