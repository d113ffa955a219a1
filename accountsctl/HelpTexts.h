#pragma once

/// What the program's help says, apart from the options themselves.
namespace accounts::help {

inline constexpr const char* kProgram =
    "Shows, compares, checks and converts the files of account migrations, and counts their "
    "results.";

inline constexpr const char* kProgramExamples =
    "Examples:\n"
    "  accountsctl show com.quarx.accountsettings.plist\n"
    "  accountsctl status --root /mnt/image\n"
    "  accountsctl diff --help\n";

/// The exit statuses that all subcommands have.
inline constexpr const char* kErrors =
    "  64  the arguments cannot be used\n"
    "  65  a file is not what it has to be\n"
    "  66  a file or the root is missing or unreadable\n"
    "  70  what read the files did what it may not do, or ended\n"
    "  73  the output file cannot be created\n"
    "  74  a file or standard output cannot be written or read\n"
    "  75  what stands in the way may pass\n";

inline constexpr const char* kShow =
    "Show a settings file, a legacy store, a migration-information file, a device description or\n"
    "any other property list; which of them it is, its content tells. Passwords and the like are\n"
    "hidden. On a terminal texts that are too long are cut; in a pipe or a file each account is "
    "one\n"
    "line with its fields whole, separated by tabs.";
inline constexpr const char* kShowStatuses = "  0   the file was shown\n";
inline constexpr const char* kShowExamples =
    "  accountsctl show com.quarx.accountsettings.plist\n"
    "  accountsctl show com.quarx.accountsettings.plist | cut -f 3,6\n"
    "  accountsctl show --properties --full Accounts.plist\n"
    "  accountsctl show --json - < com.quarx.DataAccess.plist\n";

inline constexpr const char* kDiff =
    "Compare two files of one kind, account by account. Accounts are the same if they have the\n"
    "same identifier, wherever they stand, or else if they alone have their type and name; + is "
    "an\n"
    "added account or value, - a removed one, * an account that changed or moved to another\n"
    "parent. Passwords and the like are hidden.";
inline constexpr const char* kDiffStatuses =
    "  0   the files hold the same\n"
    "  1   they differ\n";
inline constexpr const char* kDiffExamples =
    "  accountsctl diff before.plist com.quarx.accountsettings.plist\n"
    "  accountsctl diff --json before.plist - < after.plist\n";

inline constexpr const char* kCheck =
    "Say what a migration would drop, repair, ignore or refuse of a settings file or a legacy\n"
    "store, and why. The store's own code decides, with the account types of the bundle.\n"
    "With --framework: load a framework as a device does, list its classes with what they answer,\n"
    "and say what is wrong with it. Its code runs with the rights of whoever asks.";
inline constexpr const char* kCheckStatuses =
    "  0   nothing was found\n"
    "  1   something was found\n";
inline constexpr const char* kCheckExamples =
    "  accountsctl check com.quarx.accountsettings.plist\n"
    "  accountsctl check --device image/etc/device.plist --json Accounts.plist\n"
    "  accountsctl check --framework build/frameworks/Mail.framework/Mail.so\n";

inline constexpr const char* kStatus =
    "Tell what a migration would find on a device and do, and what an earlier one left behind.\n"
    "Nothing is changed, and nothing outside the root is read.";
inline constexpr const char* kStatusStatuses =
    "  0   the device was looked at\n"
    "  1   with --fail-if-pending: a migration has something to do, the settings file is\n"
    "      unreadable, or kept inputs wait for a person\n";
inline constexpr const char* kStatusExamples =
    "  accountsctl status --root /\n"
    "  accountsctl status --root /mnt/image --fail-if-pending && echo up to date\n";

inline constexpr const char* kConvert =
    "Write a property list as XML or in the binary format, its values unchanged. Nothing is "
    "hidden:\n"
    "the output holds every password that the input holds. What XML cannot hold is an error.";
inline constexpr const char* kConvertStatuses = "  0   the output was written\n";
inline constexpr const char* kConvertExamples =
    "  accountsctl convert settings.plist settings.xml --to xml\n"
    "  accountsctl convert settings.plist - --to xml | less\n"
    "  accountsctl convert edited.xml settings.plist --to binary\n";

inline constexpr const char* kExplain =
    "Tell the story of one account in a migration: where it came from, which stage did what to "
    "it,\n"
    "which values changed, and where it is now or why it is not.";
inline constexpr const char* kExplainStatuses = "  0   the report has the account\n";
inline constexpr const char* kExplainExamples =
    "  migration-host plan --root image --report plan.json\n"
    "  accountsctl explain plan.json 1A7B0001-9C3D-4E2F-8B5A-6D4C3B2A1F01\n";

inline constexpr const char* kSummarize =
    "Count what runs of migration-host with --json on many images reported: by outcome, by step "
    "and\n"
    "by error, ROOT standing for an image's root. An image that was run several times counts with\n"
    "its last result. While results come in, a terminal at standard error shows how many did.";
inline constexpr const char* kSummarizeStatuses =
    "  0   every image is migrated, or a list was asked for\n"
    "  1   an image is not migrated or has no result, or a line is no result\n";
inline constexpr const char* kSummarizeExamples =
    "  accountsctl summarize results.jsonl\n"
    "  accountsctl summarize --roots roots.txt results.jsonl\n"
    "  accountsctl summarize --roots roots.txt --html images.html results/reports\n"
    "  accountsctl summarize results.jsonl --list retry > again.txt\n"
    "  accountsctl summarize results.jsonl --list attention --reasons\n"
    "  accountsctl summarize results.jsonl --list losses --reasons\n"
    "  parallel migration-host run --json --root {} :::: roots.txt | tee results.jsonl |\n"
    "    accountsctl summarize --expected 5000 -\n";

}  // namespace accounts::help
