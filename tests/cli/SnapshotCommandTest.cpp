// Tests for `vantorel-cli snapshot`: listing a snapshot's entries, --dlf extraction of the DLF bytes, and the errors (Parts 1.3, 3.4).
#include "cli/SnapshotCommand.h"

#include "LogGenerator/LogGenerator.h"
#include "Platform/ByteReader.h"
#include "Platform/RecordBuilder.h"
#include "Platform/TelephonyIdentifiers.h"
#include "PropertyList/Array.h"
#include "PropertyList/Dictionary.h"
#include "PropertyList/PropertyListSerialization.h"

#include <QFile>
#include <QTemporaryDir>
#include "support/CommandOutput.h"

#include <gtest/gtest.h>

using namespace vantorel;

namespace {

using Output = vantorel::testing::CommandOutput;

Output runSnapshot(const QStringList& args) { return vantorel::testing::runCommand(&SnapshotCommand::run, args); }

void writeFile(const QString& path, const Bytes& bytes) {
    QFile file(path);
    ASSERT_TRUE(file.open(QIODevice::WriteOnly));
    file.write(reinterpret_cast<const char*>(bytes.data()), static_cast<qint64>(bytes.size()));
}

Bytes readFile(const QString& path) {
    QFile file(path);
    if (!file.open(QIODevice::ReadOnly)) return {};
    const QByteArray all = file.readAll();
    return Bytes(all.begin(), all.end());
}

Bytes serialise(const Value& value, PropertyListSerialization::Format format = PropertyListSerialization::Format::XML) {
    auto bytes = PropertyListSerialization::write(value, format);
    return bytes ? *bytes : Bytes();
}

// The snapshot file of Part 1.3 around the given contents, keys in the writer's order.
Value snapshotOf(const Value& contents, const char* description) {
    auto snapshot = Dictionary::create();
    snapshot->set("Timestamp", "2016-06-28 18:31:10 -0330");
    snapshot->set("Data", contents);
    snapshot->set("Description", description);
    return Value(snapshot);
}

// Save contents from the real UTRAN decoder: two history entries and the DLF entry.
Value decoderContents() {
    std::unique_ptr<LogGenerator> decoder = LogGenerator::generatorFromTechnology(kTSLogChannelTechnology_Morvek_UTRAN2);
    Dictionary state;
    decoder->updateState(state, RecordBuilder::ordinary(0xD0E0, 15)
                                    .u8(13, 1)  // validity flag
                                    .u8(14, 2)  // RRC mode
                                    .build());
    decoder->generateLogUsingState(state);
    decoder->updateState(state, RecordBuilder::ordinary(0x1234, 20).build());
    decoder->generateLogUsingState(state);
    return decoder->getSaveContentsFromState(state);
}

class SnapshotCommandTest : public ::testing::Test {
protected:
    QString path(const char* name) const { return dir.filePath(QString::fromLatin1(name)); }
    QTemporaryDir dir;
};

}  // namespace

TEST_F(SnapshotCommandTest, ListsTimestampDescriptionAndEveryEntryWithDateAndDlfSize) {
    auto dlfEntry = Dictionary::create();
    dlfEntry->set("Description", "DLF binary (163 bytes)");
    dlfEntry->set("DLF", Value::data(Bytes(163, 0x5A)));
    auto history = Dictionary::create();
    history->set("DisplayState", Value::data({1, 2, 3}));
    history->set("Date", "2016-06-28 18:31:08 -0330");
    history->set("Description", "Snapshot (2016-06-28 18:31:08 -0330)");
    auto undescribed = Dictionary::create();  // an empty history entry (Part 3.1 truncation)
    const Value contents(Array::of({Value(history), Value(undescribed), Value("odd"), Value(dlfEntry)}));
    writeFile(path("s.vantorel"), serialise(snapshotOf(contents, "cell edge, walking")));

    Output r = runSnapshot({path("s.vantorel")});
    ASSERT_EQ(r.code, 0) << r.err;
    EXPECT_EQ(r.out,
              "Timestamp: 2016-06-28 18:31:10 -0330\n"
              "Description: cell edge, walking\n"
              "Data: 4 entries\n"
              "  0  Snapshot (2016-06-28 18:31:08 -0330)\n"
              "      Date: 2016-06-28 18:31:08 -0330\n"
              "  1  (no description)\n"
              "  2  (not a dictionary: string)\n"
              "  3  DLF binary (163 bytes)\n"
              "      DLF: 163 bytes\n");
    EXPECT_EQ(r.err, "");
}

TEST_F(SnapshotCommandTest, ListsTheSaveContentsOfARealDecoderInEitherPlistFormat) {
    const Value contents = decoderContents();
    ArrayRef entries = contents.asArray();
    ASSERT_EQ(entries->size(), 3u);
    const Bytes& dlf = *entries->at(2).asDictionary()->get("DLF").asData();
    for (auto format : {PropertyListSerialization::Format::XML, PropertyListSerialization::Format::Binary}) {
        writeFile(path("real.vantorel"), serialise(snapshotOf(contents, ""), format));
        Output r = runSnapshot({path("real.vantorel")});
        ASSERT_EQ(r.code, 0) << r.err;
        const std::string first = *entries->at(0).asDictionary()->get("Description").asString();
        const std::string firstDate = *entries->at(0).asDictionary()->get("Date").asString();
        EXPECT_NE(r.out.find("Description: \nData: 3 entries\n  0  " + first + "\n      Date: " + firstDate + "\n"),
                  std::string::npos)
            << r.out;
        EXPECT_NE(r.out.find("  2  DLF binary (" + std::to_string(dlf.size()) + " bytes)\n      DLF: " +
                             std::to_string(dlf.size()) + " bytes\n"),
                  std::string::npos)
            << r.out;
    }
}

TEST_F(SnapshotCommandTest, DlfWritesExactlyTheDlfBytesVersionRecordFirst) {
    const Value contents = decoderContents();
    const Bytes dlf = *contents.asArray()->at(2).asDictionary()->get("DLF").asData();
    writeFile(path("s.vantorel"), serialise(snapshotOf(contents, "with dlf")));

    Output r = runSnapshot({path("s.vantorel"), "--dlf", path("out.dlf")});
    ASSERT_EQ(r.code, 0) << r.err;
    EXPECT_NE(r.out.find("Data: 3 entries\n"), std::string::npos);  // the listing is still printed
    const Bytes written = readFile(path("out.dlf"));
    EXPECT_EQ(written, dlf);
    ASSERT_GT(written.size(), 161u);  // the version record, then the raw records
    ByteReader reader(written);
    EXPECT_EQ(reader.u16(0), 161);     // record length
    EXPECT_EQ(reader.u16(2), 0x1FFD);  // version-report code
    EXPECT_EQ(reader.u16(12), 1);      // first version number
    // The first history buffer without its first byte: the 0xD0E0 record from its byte 1.
    EXPECT_EQ(reader.u16(161 + 2), 0xD0E0);
    EXPECT_NE(r.err.find("(" + std::to_string(dlf.size()) + " bytes) to " + path("out.dlf").toStdString()),
              std::string::npos)
        << r.err;
}

TEST_F(SnapshotCommandTest, DlfWithoutADlfEntryIsAnErrorAndWritesNothing) {
    auto entry = Dictionary::create();
    entry->set("Description", "Snapshot (x)");
    writeFile(path("s.vantorel"), serialise(snapshotOf(Value(Array::of({Value(entry)})), "no dlf")));
    Output r = runSnapshot({path("s.vantorel"), "--dlf", path("out.dlf")});
    EXPECT_EQ(r.code, 1);
    EXPECT_NE(r.err.find("no entry holds a \"DLF\""), std::string::npos) << r.err;
    EXPECT_FALSE(QFile::exists(path("out.dlf")));
}

TEST_F(SnapshotCommandTest, ADlfThatIsNotDataOrAnOutputThatCannotBeWrittenIsAnError) {
    auto entry = Dictionary::create();
    entry->set("Description", "DLF binary (3 bytes)");
    entry->set("DLF", "text, not bytes");
    writeFile(path("s.vantorel"), serialise(snapshotOf(Value(Array::of({Value(entry)})), "")));
    Output notData = runSnapshot({path("s.vantorel"), "--dlf", path("out.dlf")});
    EXPECT_EQ(notData.code, 1);
    EXPECT_NE(notData.err.find("entry 0's \"DLF\" is string, not data"), std::string::npos) << notData.err;

    writeFile(path("good.vantorel"), serialise(snapshotOf(decoderContents(), "")));
    Output unwritable = runSnapshot({path("good.vantorel"), "--dlf", path("missing-dir/out.dlf")});
    EXPECT_EQ(unwritable.code, 1);
    EXPECT_NE(unwritable.err.find("cannot write " + path("missing-dir/out.dlf").toStdString()), std::string::npos)
        << unwritable.err;
}

TEST_F(SnapshotCommandTest, AMissingFileIsAClearError) {
    Output r = runSnapshot({path("absent.vantorel")});
    EXPECT_EQ(r.code, 1);
    EXPECT_EQ(r.err, "vantorel-cli snapshot: cannot read " + path("absent.vantorel").toStdString() + ": no such file\n");
    EXPECT_EQ(r.out, "");
    EXPECT_EQ(runSnapshot({dir.path()}).code, 1);  // a directory
}

TEST_F(SnapshotCommandTest, AFileThatIsNotAPropertyListSaysSo) {
    const std::string text = "Timestamp: yesterday\n";
    writeFile(path("text.vantorel"), Bytes(text.begin(), text.end()));
    Output r = runSnapshot({path("text.vantorel")});
    EXPECT_EQ(r.code, 1);
    EXPECT_NE(r.err.find(path("text.vantorel").toStdString() + " is not a snapshot: not a property list"),
              std::string::npos)
        << r.err;
    writeFile(path("empty.vantorel"), Bytes());
    EXPECT_NE(runSnapshot({path("empty.vantorel")}).err.find("empty property list"), std::string::npos);
}

TEST_F(SnapshotCommandTest, ARootThatIsNotADictionaryIsAWrongRootType) {
    writeFile(path("array.vantorel"), serialise(Value(Array::of({Value("a")}))));
    Output r = runSnapshot({path("array.vantorel")});
    EXPECT_EQ(r.code, 1);
    EXPECT_NE(r.err.find("is not a snapshot: property list root is array, not a dictionary"), std::string::npos)
        << r.err;
}

TEST_F(SnapshotCommandTest, ADictionaryWithoutTheSnapshotKeysSaysWhichAreMissingOrWrong) {
    auto other = Dictionary::create();
    other->set("SetState", "Streaming");
    writeFile(path("command.plist"), serialise(Value(other)));
    Output missing = runSnapshot({path("command.plist")});
    EXPECT_EQ(missing.code, 1);
    EXPECT_NE(missing.err.find("is not a snapshot: it has no \"Timestamp\", \"Data\", \"Description\""),
              std::string::npos)
        << missing.err;

    auto wrongType = snapshotOf(Value("not an array"), "x");
    writeFile(path("wrong.vantorel"), serialise(wrongType));
    Output wrong = runSnapshot({path("wrong.vantorel")});
    EXPECT_EQ(wrong.code, 1);
    EXPECT_NE(wrong.err.find("is not a snapshot: its \"Data\" is string, not array"), std::string::npos) << wrong.err;
}

TEST_F(SnapshotCommandTest, UsageErrorsExitWith2AndHelpWith0) {
    EXPECT_EQ(runSnapshot({}).code, 2);
    EXPECT_EQ(runSnapshot({path("a"), path("b")}).code, 2);
    Output unknown = runSnapshot({"--frobnicate", path("a")});
    EXPECT_EQ(unknown.code, 2);
    EXPECT_NE(unknown.err.find("frobnicate"), std::string::npos) << unknown.err;
    EXPECT_EQ(runSnapshot({path("a"), "--dlf"}).code, 2);  // --dlf needs OUT
    Output help = runSnapshot({"--help"});
    EXPECT_EQ(help.code, 0);
    EXPECT_NE(help.out.find("--dlf <OUT>"), std::string::npos) << help.out;
}
