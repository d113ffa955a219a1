# Makes the directories that are packed readable for all. Those above what is installed are made with the
# umask of whoever builds the packages, which may keep everybody else out of what they install.
file(CHMOD_RECURSE ${CPACK_TEMPORARY_DIRECTORY} DIRECTORY_PERMISSIONS
  OWNER_READ OWNER_WRITE OWNER_EXECUTE GROUP_READ GROUP_EXECUTE WORLD_READ WORLD_EXECUTE)
