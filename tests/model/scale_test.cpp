// The collections at scale: the list behind them held against a plain model, default names over
// a hundred thousand members, and the notices of a scripted run the same as they always were.
#include "notice_script.h"
#include "qzivi/model/ItemList.h"
#include "tree_fixture.h"

#include <gmock/gmock.h>

#include <fstream>
#include <random>

namespace qzivi::test {
namespace {

struct Member : ListMember<Member> {
    std::string name, id;
    const std::string& Name() const { return name; }
    const std::string& UniqueId() const { return id; }
    void Rename(const std::string& to) {
        const std::string before = name;
        name = to;
        NameChanged(before);
    }
};

// Random adds, inserts, removals and renames, each followed by a check of every answer of the
// list against a plain vector and the literal rules.
TEST(ItemListTest, AnswersAsAPlainListWouldThroughRandomEdits) {
    ItemList<Member> list("Member");
    std::vector<std::shared_ptr<Member>> model;
    std::mt19937 random(7);
    auto pick = [&](std::size_t n) {
        return std::uniform_int_distribution<std::size_t>(0, n)(random);
    };
    auto names = [&] {
        std::vector<std::string> all;
        for (const auto& m : model)
            all.push_back(m->name);
        return all;
    };
    const char* words[] = {"Member1", "member2", "MEMBER3", "Member10", "Member01", "x", ""};
    for (int step = 0; step < 3000; ++step) {
        const auto op = pick(9);
        if (op <= 3 || model.empty()) {
            auto m = std::make_shared<Member>();
            m->name = pick(2) == 0 ? words[pick(6)] : list.DefaultName("Member");
            m->id = "id" + std::to_string(step);
            const std::size_t at = op == 0 ? pick(model.size()) : model.size();
            model.insert(model.begin() + static_cast<long>(at), m);
            list.Insert(static_cast<std::int32_t>(at + 1), m);
        } else if (op <= 6) {
            const std::size_t at = pick(model.size() - 1);
            EXPECT_EQ(list.At(static_cast<std::int32_t>(at + 1)), model[at]);
            list.RemoveAt(static_cast<std::int32_t>(at + 1));
            EXPECT_EQ(model[at]->List(), nullptr);
            model.erase(model.begin() + static_cast<long>(at));
        } else {
            model[pick(model.size() - 1)]->Rename(pick(1) ? words[pick(6)]
                                                          : "Member" + std::to_string(pick(40)));
        }
        ASSERT_EQ(list.Count(), static_cast<std::int32_t>(model.size()));
        for (std::size_t i = 0; i < model.size(); ++i)
            ASSERT_EQ(list.IndexOfObject(model[i].get()), static_cast<std::int32_t>(i + 1)) << step;
        std::size_t walked = 0;
        for (const auto& m : list)
            ASSERT_EQ(m, model[walked++]);
        ASSERT_EQ(list.DefaultName("Member"), MakeUniqueName(names(), "Member")) << step;
        for (const char* word : words) {
            const std::string name = word;
            std::int32_t exact = -1;
            std::shared_ptr<Member> first;
            for (std::size_t i = model.size(); i-- > 0;) {
                if (model[i]->name == name) exact = static_cast<std::int32_t>(i + 1);
                if (text::EqualsNoCase(model[i]->name, name)) first = model[i];
            }
            ASSERT_EQ(list.IndexOfName(name), exact) << name;
            ASSERT_EQ(list.FindName(name), first) << name;
        }
        const auto& probe = model.empty() ? std::string("none") : model[pick(model.size() - 1)]->id;
        ASSERT_EQ(list.ContainsUniqueId(probe), !model.empty());
    }
}

class ScaleTest : public TreeTest {};

// The old collections needed hours for this many default names; the names and the lowest-free
// rule are unchanged.
TEST_F(ScaleTest, AHundredThousandDefaultNamesFollowTheLowestFreeRule) {
    auto& waveforms = *tree_->Waveforms();
    constexpr int kCount = 100000;
    for (int i = 0; i < kCount; ++i)
        waveforms.Add();
    ASSERT_EQ(waveforms.Count(), kCount);
    for (int i = 1; i <= kCount; i += 997)
        ASSERT_EQ(waveforms.At(i)->Name(), "Waveform" + std::to_string(i));
    EXPECT_EQ(waveforms.Item("WAVEFORM77777"), waveforms.At(77777));
    EXPECT_EQ(waveforms.IndexOfName("waveform77777"), -1) << "IndexOfName compares exactly";

    waveforms.Remove("Waveform99999");
    waveforms.Remove(5);                                 // Waveform5
    waveforms.Item("Waveform10")->Name("Other");         // frees 10
    waveforms.Item("Waveform3")->Name("WAVEFORM200000"); // frees 3, takes 200000
    waveforms.Add("waveform7");                          // a second 7: removing one keeps 7 taken
    waveforms.Remove("Waveform7");
    std::vector<std::string> added;
    for (int i = 0; i < 5; ++i)
        added.push_back(waveforms.Add()->Name());
    EXPECT_EQ(added, (std::vector<std::string>{"Waveform3", "Waveform5", "Waveform10",
                                               "Waveform99999", "Waveform100001"}));
    EXPECT_EQ(waveforms.IndexOfObject(waveforms.Item("Waveform100001").get()), waveforms.Count());
}

TEST_F(ScaleTest, ANoticeRunIsTheSameAsTheFirstImplementationsNoticeForNotice) {
    std::ifstream file(QZIVI_TEST_DATA_DIR "/notices_600.txt");
    ASSERT_TRUE(file) << "the recorded notices are missing";
    std::vector<std::string> expected;
    for (std::string line; std::getline(file, line);)
        expected.push_back(line);
    const auto lines = RunNoticeScript(tree_, 600);
    ASSERT_EQ(lines.size(), expected.size());
    for (std::size_t i = 0; i < lines.size(); ++i)
        ASSERT_EQ(lines[i], expected[i]) << "line " << i + 1;
}

} // namespace
} // namespace qzivi::test
