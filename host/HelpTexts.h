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
    "The settings file and the legacy stores are kept until the result is verified, and put back\n"
    "if it cannot be; with --bare the plug-in's result is reported as it stands. Standard error\n"
    "carries the plug-in's console lines, standard output a short summary or, with --json, one\n"
    "object on one line.";
inline constexpr const char* kRunStatuses =
    "  0   the plug-in reported success, which was verified unless --bare is given\n"
    "  1   the plug-in reported failure\n"
    "  2   the plug-in reported success, which was not verified: the files are put back\n";
inline constexpr const char* kRunErrors =
    "  70  the plug-in ended by an assertion or a signal\n"
    "  73  a file of the host's own cannot be created\n"
    "  74  a file or stream of the host's own cannot be written or read\n"
    "  75  what stands in the way may pass: another host has the root, no room, a device that\n"
    "      does not answer, the host was asked to stop\n";
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
    "Put back the settings file and the legacy stores that a run kept.\n\n"
    "A run that was killed, or that may not have carried over everything, leaves them in\n"
    "/var/mobile/Library/AccountMigration/Kept-TIME on the device. What is replaced is itself\n"
    "kept, in Replaced-TIME beside it, and the folder whose files are back is removed.";
inline constexpr const char* kRestoreStatuses = "  0   the files are back\n";
inline constexpr const char* kRestoreErrors =
    "  73  what would be replaced cannot be kept; nothing was changed\n"
    "  74  the files cannot be put back; the folder is still whole\n"
    "  75  what stands in the way may pass; nothing was changed\n";
inline constexpr const char* kRestoreExamples =
    "  migration-host restore --root /mnt/image\n"
    "  migration-host restore --root /mnt/image --from Kept-20260102T030405Z\n";

}  // namespace accounts::help
