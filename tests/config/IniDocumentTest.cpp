#include "../fuzz/IniModel.h"
#include "config/IniDocument.h"
#include "support/StartedMemory.h"
#include "support/Test.h"
#include "support/malloc/FailingMalloc.h"

namespace tessel::test {
namespace {

using namespace std::string_literals;

struct Gathered final : IniDocument::Output {
    bool Write(const char* data, std::size_t size) override {
        bytes.append(data, size);
        return true;
    }
    std::string bytes;
};

std::string Written(const IniDocument& document) {
    Gathered output;
    EXPECT_TRUE(document.Write(output));
    return output.bytes;
}

MgErr Read(IniDocument& document, const std::string& bytes) {
    IniTexts texts;
    char* const text = texts.Allocate(bytes.size() + 1);
    bytes.copy(text, bytes.size());
    text[bytes.size()] = 0;
    return document.Read(std::move(texts), {text, bytes.size()});
}

class IniDocumentTest : public testing::Test {
protected:
    StartedMemory started;
    IniDocument document;
};

TEST_F(IniDocumentTest, ReadsAndWritesLinesAsTheyAreDefined) {
    const struct {
        std::string read, written;
    } rows[] = {
        {"", ""},
        {"Key = value\nKey2:value\rKey3 := value\r\n", "Key=value\r\nKey2=value\r\nKey3=value\r\n"},
        {"[s]\nkey=\n \t\n=x\nno\n[\n[ ]\n;c=d\n", "[s]\r\nkey=\r\n \t\r\n=x\r\nno\r\n[\r\n[ ]\r\n;c=d\r\n"},
        {"[ Section ]trailing\na::=b", "[Section]\r\na=:=b\r\n"},
        {" ; a=b\n\v[S\t]\n\f k\t=\v v w \f\n", " ; a=b\r\n[S]\r\nk=v w\r\n"},
        {"a=1\n\r\n\r\n\rb=2\r\r\n", "a=1\r\n\r\n\r\nb=2\r\n\r\n"},
        {"a=1\0b=2\0\n[c]\0d=3\0"s, "a=1\r\nb=2\r\n\r\n[c]\r\nd=3\r\n"},
        {"a=\"b\"\nc=\"\nd=\"\"\ne=\"\"x\"\"\nf='g'\n", "a=\"b\"\r\nc=\"\r\nd=\"\"\r\ne=\"\"x\"\"\r\nf='g'\r\n"},
        {"\xEF\xBB\xBF;m\n[a]\nb=c", ";m\r\n[a]\r\nb=c\r\n"},
        // Comments of what is repeated.
        {"[a]\nb=1\n;x\n[A]\n;y\nB=2\n;z\n[c]\n", "[a]\r\n;x\r\n;y\r\nb=2\r\n;z\r\n[c]\r\n"},
        // The keys without a section.
        {";x\n[a]\nb=1\n;n\n[(NULL)]\nc=2\n", ";n\r\nc=2\r\n;x\r\n[a]\r\nb=1\r\n"},
        // Continued values.
        {"A Line0001=ab\nA Line0002=cd", "A=abcd\r\n"},
        {"A Line1=\" a\"\n;2\nA Line2=b\nA Line1=c\nB Line3=d\ne=f\ng Line2=h\n",
         ";2\r\nA=cbd\r\ne=f\r\ng Line2=h\r\n"},
        {"x Line1=1\ny Line01=2\ny line2=3\nz Line=4\nX=5\n", "x=5\r\ny=2\r\ny line2=3\r\nz Line=4\r\n"},
        {"q Line1=\"a \"\nq Line2=b\nX Line1 Line1=c\n", "q=\"a b\"\r\nX Line1=c\r\n"},
        {"Line1=a\n", "Line1=a\r\n"},
    };
    for (const auto& row : rows) {
        EXPECT_EQ(kNoErr, Read(document, row.read));
        EXPECT_EQ(row.written, Written(document)) << row.read;
    }
    for (const std::string& mark : {"\xFF\xFE"s, "\xFE\xFF"s, "\xFF\xFE\0\0"s, "\0\0\xFE\xFF"s}) {
        EXPECT_EQ(kUnsupportedErr, Read(document, mark + "a=b"));
    }
    EXPECT_EQ("Line1=a\r\n", Written(document));  // what is refused leaves the document
}

TEST_F(IniDocumentTest, FindsByNamesWithoutCaseAndWithoutSpaceAround) {
    ASSERT_EQ(kNoErr, Read(document, "bad\n[Abc \xC3\x84]\n Key One = v\nnumber of 8=2\nZ@[`{=3\n"));
    for (const char* key : {"key one", "KEY ONE", "\tKey One  "}) {
        ASSERT_NE(nullptr, document.Find(" aBC \xC3\x84 ", key)) << key;
        EXPECT_EQ("v", *document.Find("abc \xC3\x84", key));
    }
    for (const char* key : {"key  one", "keyone", "key", "key one x", "number of 9", "z`[`{", "z@{`{", ""}) {
        EXPECT_EQ(nullptr, document.Find("abc \xC3\x84", key)) << key;
    }
    EXPECT_EQ(nullptr, document.Find("abc \xC3\xA4", "key one"));  // another letter here
    EXPECT_EACH(document.Set("abc \xC3\x84", "new", "v") == kNoErr, document.LineOf("abc \xC3\x84", "key one") == 3,
                document.LineOf("abc \xC3\x84", "new") == -1, document.FirstUnparsableLine() == 1);
}

TEST_F(IniDocumentTest, ChangesShowWhereTheyBelong) {
    ASSERT_EQ(kNoErr, Read(document, ";1\n[a]\n;2\nb=c\n;3\nd=e\n;4\n[f]\n;5\ng=h\n;6"));
    EXPECT_EACH(document.Set(" \t", "k", "v") == kConfigTypeErr, document.Set("s", "\r\n", "v") == kConfigTypeErr,
                document.Set(" new ", " k ", " \"v \" ") == kNoErr,
                document.Set("New", "l", "two\nlines\r\n") == kNoErr, document.Set("next", "n", "") == kNoErr,
                document.Set("(null)", "none", "0") == kNoErr);
    for (const char* name : {"b", "D", "missing"}) {
        bool removed = false;
        EXPECT_EACH(document.Remove("a", name, removed) == kNoErr, (name != "missing"s) == removed);
    }
    EXPECT_EACH(
        "none=0\r\n;1\r\n[a]\r\n;2\r\n;3\r\n;4\r\n[f]\r\n;5\r\ng=h\r\n\r\n[new]\r\nk=\"v \"\r\nl=two\r\nlines\r\n"
        "\r\n[next]\r\nn=\r\n\r\n;6\r\n" == Written(document));
    std::vector<std::string> names;
    document.ListSections(names);
    EXPECT_THAT(names, ElementsAre("(null)", "a", "f", "new", "next"));
    names.clear();
    document.ListKeys("NEW", names);
    EXPECT_THAT(names, ElementsAre("k", "l"));
}

// Files of pieces that mean something, and changes between them.
TEST_F(IniDocumentTest, AgreesWithTheModel) {
    const std::string pieces[] = {
        "[",  "]",  "a",  "B",    "a Line1=", "A Line02=", "=",   ":=", ":",  ";", "\"",     " ",
        "\t", "\r", "\n", "\r\n", "\n",       "\n",        "\0"s, "=v", "=w", "b", "(null)", "[a]\n"};
    std::mt19937 random(1);
    const auto pick = [&](std::size_t count) { return random() % count; };
    const auto text = [&](std::size_t most) {
        std::string made;
        for (std::size_t left = pick(most + 1); left > 0; --left) made += pieces[pick(std::size(pieces))];
        return made;
    };
    IniModel model;
    for (int round = 0; round < 5000; ++round) {
        const std::string bytes = text(40);
        ASSERT_TRUE(model.Read(bytes));
        ASSERT_EQ(kNoErr, Read(document, bytes));
        for (int change = 0; change < 6; ++change) {
            ASSERT_EQ(model.Write(), Written(document)) << bytes;
            const std::string section = pick(4) ? "a" : text(3), key = pick(2) ? "b" : text(2), value = text(4);
            if (IniModel::Trim(section).empty() || IniModel::Trim(key).empty()) continue;
            const auto expected = model.Get(section, key);
            const std::string_view* const found = document.Find(section, key);
            ASSERT_EQ(expected.has_value(), found != nullptr) << bytes;
            if (found) {
                ASSERT_EQ(*expected, *found);
            }
            bool removed = false;
            if (pick(3)) {
                model.Set(section, key, value);
                ASSERT_EQ(kNoErr, document.Set(section, key, value));
            } else {
                model.Remove(section, key);
                ASSERT_EQ(kNoErr, document.Remove(section, key, removed));
                ASSERT_EQ(expected.has_value(), removed);
            }
        }
    }
}

TEST_F(IniDocumentTest, ManyChangesTakeNoMoreAndMoreMemory) {
    IniModel model;
    ASSERT_EQ(kNoErr, Read(document, ""));
    for (int round = 0; round < 3000; ++round) {
        const std::string key = "key " + std::to_string(round % 50), value(static_cast<std::size_t>(round % 300), 'v');
        bool removed = false;
        if (round % 7 == 0) {
            ASSERT_EQ(kNoErr, document.Remove("s", key, removed));
            model.Remove("s", key);
        }
        ASSERT_EQ(kNoErr, document.Set("s", key, value));
        model.Set("s", key, value);
    }
    EXPECT_EQ(model.Write(), Written(document));
    EXPECT_LT(document.TextBytes(), 200'000u);
}

TEST_F(IniDocumentTest, NamesASectionOnlyWhenItIsTheOnlyOne) {
    const char* rows[][3] = {{";c\na=b\n", "App", "[App]\r\n;c\r\na=b\r\n"},
                             {"a=b\n", " ", "a=b\r\n"},
                             {"a=b\n[c]\n", "App", "a=b\r\n[c]\r\n"},
                             {"[c]\n", "App", "[c]\r\n"},
                             {"a=b\n", "(Null)", "a=b\r\n"},
                             {";\n", "App", ";\r\n"}};
    for (const auto& [read, name, written] : rows) {
        ASSERT_EQ(kNoErr, Read(document, read));
        EXPECT_EACH((written[1] == 'A') == document.NameOnlySection(name), written == Written(document),
                    (written[1] == 'A') == (document.Find("APP", "A") != nullptr));
    }
}

TEST_F(IniDocumentTest, AnAllocationThatFailsChangesNothing) {
    const std::string before = ";1\r\n[a]\r\nb=1\r\n";
    ASSERT_EQ(kNoErr, Read(document, before));
    const auto eachFailing = [&](auto change) {
        int n = 0;
        for (bool changed = false; !changed;) {
            try {
                const FailingMalloc failing(++n);
                change();
                changed = !failing.HasFailed();
            } catch (const std::bad_alloc&) {
            }
            EXPECT_NE(changed, before == Written(document)) << n;
        }
        return n;
    };
    EXPECT_GT(eachFailing([&] { document.Set("new", std::string(5000, 'k'), std::string(9000, 'v')); }), 3);
    EXPECT_EQ(9000u, document.Find("new", std::string(5000, 'K'))->size());
    ASSERT_EQ(kNoErr, Read(document, before));
    EXPECT_GT(eachFailing([&] { Read(document, "x Line1=2\n;\n[y]\nz=3\n"); }), 3);
    EXPECT_EQ("x=2\r\n;\r\n[y]\r\nz=3\r\n", Written(document));
}

}  // namespace
}  // namespace tessel::test
