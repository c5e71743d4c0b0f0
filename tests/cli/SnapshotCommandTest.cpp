// Tests for `vantorel-cli snapshot`: listing a snapshot's entries, extracting the DLF bytes of a real decoder's snapshot, and every kind of bad input.
#include "cli/SnapshotCommand.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"
#include "support/CommandOutput.h"
#include "support/HostilePlist.h"

#include <QFile>
#include <QTemporaryDir>
#include <gtest/gtest.h>

using namespace vantorel;
using vantorel::testing::CommandOutput;
using Format = PropertyListSerialization::Format;

namespace {

class SnapshotCommandTest : public ::testing::Test {
protected:
    QString path(const char* name) const { return dir.filePath(QString::fromLatin1(name)); }
    void write(const char* name, const Bytes& bytes) {
        QFile file(path(name));
        ASSERT_TRUE(file.open(QIODevice::WriteOnly));
        file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
    }
    void write(const char* name, const Value& plist, Format format = Format::XML) {
        write(name, *PropertyListSerialization::write(plist, format));
    }
    static Value entry(const char* key, const Value& value) {
        auto d = Dictionary::create();
        d->set(key, value);
        return Value(d);
    }
    // The file the save screen writes around `contents`.
    static Value snapshotOf(const Value& contents) {
        auto snapshot = entry("Timestamp", "2016-06-28 18:31:10 -0330").asDictionary();
        snapshot->set("Data", contents);
        snapshot->set("Description", "cell edge\x1b]0;owned\x07, walking\x1b[2J");
        return Value(snapshot);
    }
    CommandOutput run(const QStringList& args) { return vantorel::testing::runCommand(&SnapshotCommand::run, args); }
    QTemporaryDir dir;
};

}  // namespace

TEST_F(SnapshotCommandTest, ListsEveryEntryAndWritesOutTheDlfOfARealDecoderInEitherFormat) {
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    Dictionary state;
    decoder->updateState(state, RecordBuilder::ordinary(0xD0E0, 15).u8(13, 1).u8(14, 2).build());
    decoder->generateLogUsingState(state);
    decoder->generateLogUsingState(state);
    ArrayRef contents = decoder->getSaveContentsFromState(state).asArray();
    const Bytes dlf = *contents->at(2).asDictionary()->get("DLF").asData();
    const std::string first = *contents->at(0).asDictionary()->get("Description").asString();
    const std::string date = *contents->at(0).asDictionary()->get("Date").asString();
    contents->append(entry("Other", Value("x")));
    contents->append(Value("odd"));
    for (Format format : {Format::XML, Format::Binary}) {
        write("s.vantorel", snapshotOf(Value(contents)), format);
        CommandOutput r = run({path("s.vantorel"), "--dlf", path("out.dlf")});
        ASSERT_EQ(r.code, 0) << r.err;
        EXPECT_EQ(r.out.rfind("Timestamp: 2016-06-28 18:31:10 -0330\nDescription: cell edge\\x1b]0;owned\\x07, walking\\x1b[2J\n"
                  "Data: 5 entries\n  0  " +
                      first + "\n      Date: " + date + "\n      Display:\n        Technology: UTRAN (TD-SCDMA)\n" +
                      "        Serving Cell\n          RRC Info\n            State: ", 0), 0u)
            << r.out;
        CommandOutput json = run({"--format", "json", path("s.vantorel")});
        EXPECT_NE(json.out.find("      Display:\n        {\n            \"Technology\": \"UTRAN (TD-SCDMA)\",\n"),
                  std::string::npos) << json.out;
        const std::string size = std::to_string(dlf.size());
        EXPECT_NE(r.out.find("  2  DLF binary (" + size + " bytes)\n      DLF: " + size + " bytes\n"
                             "  3  (no description)\n  4  (not a dictionary: string)\n"),
                  std::string::npos)
            << r.out;
        QFile out(path("out.dlf"));
        ASSERT_TRUE(out.open(QIODevice::ReadOnly));
        const QByteArray written = out.readAll();
        EXPECT_EQ(Bytes(written.begin(), written.end()), dlf);
    }
}

TEST_F(SnapshotCommandTest, BadInputIsAClearErrorAndWritesNothing) {
    write("text", Bytes{'h', 'i', '\n'});
    write("array", Value(Array::of({Value("a")})));
    write("command", entry("SetState", Value("Streaming")));
    write("wrongType", snapshotOf(Value("not an array")));
    write("noDlf", snapshotOf(Value(Array::of({entry("Description", Value("Snapshot (x)"))}))));
    write("dlfText", snapshotOf(Value(Array::of({entry("DLF", Value("text"))}))));
    write("good", snapshotOf(Value(Array::of({entry("DLF", Value::data({1, 2, 3}))}))));
    write("nul", vantorel::testing::withNulCharacter(snapshotOf(Value(Array::of({entry("Description", "\u00e9-")})))));
    const struct {
        QStringList args;
        int code;
        const char* says;
    } rows[] = {
        {{path("absent")}, 1, "cannot read " },
        {{dir.path()}, 1, "is a directory"},
        {{path("text")}, 1, "is not a snapshot: not a property list"},
        {{path("array")}, 1, "is not a snapshot: property list root is array, not a dictionary"},
        {{path("command")}, 1, "is not a snapshot: it has no \"Timestamp\", \"Data\", \"Description\""},
        {{path("nul")}, 1, "is not a snapshot: string holds a NUL character"},
        {{path("wrongType")}, 1, "is not a snapshot: its \"Data\" is string, not array"},
        {{path("noDlf"), "--dlf", path("out.dlf")}, 1, "no entry holds a \"DLF\""},
        {{path("dlfText"), "--dlf", path("out.dlf")}, 1, "entry 0's \"DLF\" is string, not data"},
        {{path("good"), "--dlf", path("missing-dir/out.dlf")}, 1, "cannot write "},
        {{}, 2, "no FILE given"},
        {{path("a"), path("b")}, 2, "one FILE at a time"},
        {{path("good"), "--format", "yaml"}, 2, "unknown --format 'yaml'"},
    };
    for (const auto& row : rows) {
        CommandOutput r = run(row.args);
        EXPECT_EQ(r.code, row.code) << row.says;
        EXPECT_NE(r.err.find(row.says), std::string::npos) << r.err;
    }
    EXPECT_FALSE(QFile::exists(path("out.dlf")));
}
