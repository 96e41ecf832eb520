// Texts that the sources keep in constants, where xgettext does not see that they are translated.
translatable("Install")
translatable("Agree")
translatable("Not Now")
translatable("Installing printer software...")
translatable("The printer software is installed.")
translatable("The printer software could not be installed.")
