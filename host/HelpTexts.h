#pragma once

/// What the program's help says, apart from the options themselves.
namespace accounts::help {

inline constexpr const char* kProgram = "Runs the account-settings migration plug-in.";

inline constexpr const char* kProgramExamples =
    "Examples:\n"
    "  migration-host plan --root /mnt/image\n"
    "  migration-host run --root /mnt/image --html report.html\n"
    "  migration-host restore --root /mnt/image\n"
    "  migration-host run --help\n";

/// The exit statuses that all subcommands have.
inline constexpr const char* kErrors =
    "  64  the arguments cannot be used\n"
    "  66  no such root, device description or bundle, or nothing is kept\n";

inline constexpr const char* kRun =
    "Run the account-settings migration on one device root.\n\n"
    "The plug-in works in memory. What came of it is verified and then put on the device in one\n"
    "step; until then nothing beneath the root is changed, whatever fails. The files as they were\n"
    "are kept when something was not carried over. Standard error carries the plug-in's\n"
    "console lines, standard output a short summary or, with --json, one object on one line.\n"
    "With --bare the plug-in works on the device itself, and its result is reported as it stands.";
inline constexpr const char* kRunStatuses =
    "  0   migrated, and every account is accounted for; with --bare: the plug-in reported "
    "success\n"
    "  1   the plug-in reported failure; without --bare nothing is changed\n"
    "  2   the plug-in reported success, which was not verified: nothing is changed\n"
    "  3   migrated, but something was not carried over: it is named, and the files as they were\n"
    "      are kept\n";
inline constexpr const char* kRunErrors =
    "  70  the plug-in ended by an assertion or a signal\n"
    "  73  a file of the host's own cannot be created\n"
    "  74  a file or stream of the host's own cannot be written or read\n"
    "  75  what stands in the way may pass: another process has the root or the migration lock, "
    "no\n"
    "      room, a program that writes the files again and again, the host was asked to stop\n";
inline constexpr const char* kRunExamples =
    "  migration-host run --root /                             the running device\n"
    "  migration-host run --root /mnt/image --json             an image, for a program to read\n"
    "  migration-host run --root /mnt/image --html report.html every change, for a browser\n"
    "  migration-host run --root /mnt/image --channel -        the log channel as well\n"
    "  migration-host run --root image --json --lock-timeout 60 one of many images\n"
    "  migration-host run --root / --channel journal --broadcast dbus\n"
    "  migration-host run --root image --device other.plist    answers of another device\n";

inline constexpr const char* kPlan =
    "Show what a run would do to one device root.\n\n"
    "The whole migration runs on the root's files in memory; nothing beneath the root is written,\n"
    "which may be mounted read-only. Standard output carries each stage with the accounts that it\n"
    "changes, every property before and after, and the files that it writes or removes. Passwords\n"
    "and the like are hidden. Fresh identifiers are other ones in each run, and whether the disk\n"
    "has room is not foreseen.";
inline constexpr const char* kPlanStatuses =
    "  0   a run would succeed\n"
    "  1   the plug-in would report failure\n"
    "  2   the plug-in would report success, which would not be verified\n";
inline constexpr const char* kPlanExamples =
    "  migration-host plan --root /mnt/image\n"
    "  migration-host plan --root /mnt/image --html plan.html --json > plan.json\n";

inline constexpr const char* kRestore =
    "Put back what a run kept, or show or remove it.\n\n"
    "A run that may not have carried over everything, or that is asked to, keeps the files as "
    "they\n"
    "were in /var/mobile/Library/AccountMigration/Kept-TIME on the device. They come back as they\n"
    "were, and where nothing was, nothing is again. What is replaced or removed is itself kept, "
    "in\n"
    "Replaced-TIME beside it, and the folder whose files are back is removed.";
inline constexpr const char* kRestoreStatuses = "  0   the files are back, shown or removed\n";
inline constexpr const char* kRestoreErrors =
    "  73  what would be replaced cannot be kept; nothing was changed\n"
    "  74  the files cannot be put back; the folder is still whole\n"
    "  75  what stands in the way may pass; nothing was changed\n";
inline constexpr const char* kRestoreExamples =
    "  migration-host restore --root /mnt/image\n"
    "  migration-host restore --root /mnt/image --list\n"
    "  migration-host restore --root /mnt/image --from Kept-20260102T030405Z\n"
    "  migration-host restore --root /mnt/image --discard --from Replaced-20260102T030406Z\n";

}  // namespace accounts::help
